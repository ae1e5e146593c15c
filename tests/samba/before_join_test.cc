// What the host had before the join comes back.

#include "helper/before_join.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include "common/paths.h"
#include "common/smb_conf.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

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
  before_join::PutAside();
  testsupport::RemoveFile(paths::kKeytab);
  before_join::GiveBack();
  struct stat after {};
  ASSERT_EQ(stat(paths::kKeytab, &after), 0);
  EXPECT_EQ(after.st_uid, before.st_uid);
  EXPECT_EQ(after.st_gid, before.st_gid);
}

TEST_F(BeforeJoinTest, FilesThatWereNotThereAreRemoved) {
  before_join::PutAside();
  WriteSmbConf("ours");
  testsupport::WriteFile(paths::kKeytab, "new");
  before_join::GiveBack();
  EXPECT_FALSE(testsupport::Exists(paths::kSmbConf));
  EXPECT_FALSE(testsupport::Exists(paths::kKeytab));
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
