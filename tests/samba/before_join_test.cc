// What the host had before the join comes back.

#include "helper/before_join.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <utility>
#include <vector>

#include "common/paths.h"
#include "common/smb_conf.h"
#include "support/files.h"
#include "support/interpose.h"

namespace sambaprovider {
namespace {

namespace calls = testsupport::calls;

class BeforeJoinTest : public testing::Test {
 protected:
  BeforeJoinTest() {
    testsupport::MakeFolders("/var/lib/quenix/samba");
    testsupport::MakeFolders("/etc/samba");
    samba_ = std::make_unique<testsupport::SmallFileSystem>("/etc/samba", 65536);
    if (testsupport::Exists(paths::kKeytab)) testsupport::RemoveFile(paths::kKeytab);
  }

  std::unique_ptr<testsupport::SmallFileSystem> samba_;
};

TEST_F(BeforeJoinTest, FilesThatWereThereAreGivenBack) {
  testsupport::WriteFile(paths::kSmbConf, "before");
  testsupport::WriteFile(paths::kKeytab, std::string("\x05\x02\0k", 4));
  before_join::PutAside();
  WriteSmbConf("ours");
  testsupport::WriteFile(paths::kKeytab, "new");
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
  EXPECT_EQ(testsupport::ReadFile(paths::kKeytab), std::string("\x05\x02\0k", 4));
}

TEST_F(BeforeJoinTest, FilesGetTheirModesBack) {
  testsupport::WriteFile(paths::kSmbConf, "before");
  testsupport::SetMode(paths::kSmbConf, 0640);
  testsupport::WriteFile(paths::kKeytab, "key");
  testsupport::SetMode(paths::kKeytab, 0440);
  before_join::PutAside();
  WriteSmbConf("ours");
  testsupport::RemoveFile(paths::kKeytab);
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ModeOf(paths::kSmbConf), 0640U);
  EXPECT_EQ(testsupport::ModeOf(paths::kKeytab), 0440U);
}

TEST_F(BeforeJoinTest, FilesGetTheirOwnersBack) {
  testsupport::WriteFile(paths::kKeytab, "key");
  // Not every sandbox may give files away; the owner is kept in any case.
  static_cast<void>(!chown(paths::kKeytab, 12, 34));
  struct stat before {};
  ASSERT_EQ(stat(paths::kKeytab, &before), 0);
  using Owner = std::pair<uid_t, gid_t>;
  std::vector<Owner> given;
  const testsupport::TakeOver watch(calls::fchown, [&given](int file, uid_t owner, gid_t group) {
    given.emplace_back(owner, group);
    return calls::fchown.Real(file, owner, group);
  });
  before_join::PutAside();
  testsupport::RemoveFile(paths::kKeytab);
  before_join::GiveBack();
  EXPECT_EQ(given, std::vector<Owner>(2, {before.st_uid, before.st_gid}));
  struct stat after {};
  ASSERT_EQ(stat(paths::kKeytab, &after), 0);
  EXPECT_EQ(Owner(after.st_uid, after.st_gid), Owner(before.st_uid, before.st_gid));
}

TEST_F(BeforeJoinTest, OwnerThatIsUnknownHereIsNoObstacle) {
  testsupport::WriteFile(paths::kKeytab, "key");
  const testsupport::TakeOver refuse(calls::fchown, [](int, uid_t, gid_t) {
    errno = EINVAL;
    return -1;
  });
  before_join::PutAside();
  testsupport::RemoveFile(paths::kKeytab);
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ReadFile(paths::kKeytab), "key");
}

TEST_F(BeforeJoinTest, FilesThatWereNotThereAreRemoved) {
  before_join::PutAside();
  WriteSmbConf("ours");
  testsupport::WriteFile(paths::kKeytab, "new");
  before_join::GiveBack();
  EXPECT_FALSE(testsupport::Exists(paths::kSmbConf));
  EXPECT_FALSE(testsupport::Exists(paths::kKeytab));
}

TEST_F(BeforeJoinTest, TheKeytabBehindALinkIsGivenBackThere) {
  const std::string target = "/etc/samba/host.keytab";
  testsupport::WriteFile(target, "before");
  std::filesystem::create_symlink(target, paths::kKeytab);
  before_join::PutAside();
  testsupport::WriteFile(paths::kKeytab, "new");
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ReadFile(target), "before");
  EXPECT_TRUE(std::filesystem::is_symlink(paths::kKeytab));
}

TEST_F(BeforeJoinTest, ANewKeytabBehindALinkIsRemovedThere) {
  const std::string target = "/etc/samba/host.keytab";
  std::filesystem::create_symlink(target, paths::kKeytab);
  before_join::PutAside();
  testsupport::WriteFile(paths::kKeytab, "new");
  before_join::GiveBack();
  EXPECT_FALSE(testsupport::Exists(target));
  EXPECT_TRUE(std::filesystem::is_symlink(paths::kKeytab));
}

TEST_F(BeforeJoinTest, AnAdministratorsNewFileIsLeftAlone) {
  testsupport::WriteFile(paths::kSmbConf, "before");
  before_join::PutAside();
  WriteSmbConf("ours");
  testsupport::WriteFile(paths::kSmbConf, "theirs");
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "theirs");
}

TEST_F(BeforeJoinTest, GivingBackTwiceIsTheSameAsOnce) {
  testsupport::WriteFile(paths::kSmbConf, "before");
  before_join::PutAside();
  WriteSmbConf("ours");
  before_join::GiveBack();
  before_join::GiveBack();
  EXPECT_EQ(testsupport::ReadFile(paths::kSmbConf), "before");
}

TEST_F(BeforeJoinTest, TheCopiesAreForRootOnly) {
  before_join::PutAside();
  EXPECT_EQ(testsupport::ModeOf(paths::kBeforeFolder), 0700U);
}

TEST_F(BeforeJoinTest, DroppedCopiesAreGone) {
  before_join::PutAside();
  before_join::DropCopies();
  EXPECT_FALSE(testsupport::Exists(paths::kBeforeFolder));
}

}  // namespace
}  // namespace sambaprovider
