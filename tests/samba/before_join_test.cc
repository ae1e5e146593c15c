// What the host had before the join comes back.

#include "helper/before_join.h"

#include <gtest/gtest.h>

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
  EXPECT_EQ(testsupport::ModeOf(paths::kSmbConf), 0644U);
  EXPECT_EQ(testsupport::ModeOf(paths::kKeytab), 0600U);
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
  testsupport::WriteFile(paths::kKeytab, "key");
  before_join::PutAside();
  EXPECT_EQ(testsupport::ModeOf(paths::kBeforeFolder), 0700U);
  EXPECT_EQ(testsupport::ModeOf(std::string(paths::kBeforeFolder) + "/krb5.keytab"), 0600U);
}

TEST_F(BeforeJoinTest, DroppedCopiesAreGone) {
  before_join::PutAside();
  before_join::DropCopies();
  EXPECT_FALSE(testsupport::Exists(paths::kBeforeFolder));
}

}  // namespace
}  // namespace sambaprovider
