// A leave without an account: the machine's secrets are gone afterwards, or the host is still a member.

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>
extern "C" {
#include <tdb.h>
}

#include <memory>
#include <string>

#include "common/attempt_log.h"
#include "common/paths.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "helper/machine_password.h"
#include "helper/operations.h"
#include "in_child.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

const std::string SECRETS_FOLDER = "/var/lib/samba/private";

class LeaveTest : public testing::Test {
 protected:
  LeaveTest() {
    testsupport::MakeFolders(paths::kStateFolder);
    testsupport::MakeFolders(SECRETS_FOLDER);
    testsupport::MakeFolders("/etc/samba");
    samba_ = std::make_unique<testsupport::SmallFileSystem>("/etc/samba", 65536);
    State state;
    state.joined = true;
    state.dnsDomain = "corp.example";
    state.netbiosDomain = "CORP";
    state.hostName = "SANDBOX";
    SaveState(state);
    WriteSmbConf(FormatSmbConf(state, Settings{}, KeytabUse::kKept));
    StoreSecrets();
  }

  static uint32_t RunLeave() {
    return StatusInChild([] {
      const AttemptLog log(1, "leave");
      Request request;
      request.fields = {{"operation", "leave"}};
      Leave({log, Settings{}, request});
    });
  }

 private:
  static void StoreSecrets() {
    tdb_context* const database = tdb_open(paths::kSecrets, 0, TDB_DEFAULT, O_RDWR | O_CREAT, 0600);
    ASSERT_NE(database, nullptr);
    // The domain's SID, S-1-5-21-1-2-3, as Samba keeps it: revision, count, authority, room for fifteen
    // numbers.
    std::string sid("\x01\x04\0\0\0\0\0\x05\x15\0\0\0\x01\0\0\0\x02\0\0\0\x03\0\0\0", 24);
    sid.resize(68);
    Store(database, "SECRETS/SID/CORP", sid);
    Store(database, "SECRETS/MACHINE_PASSWORD/CORP", std::string("Machine-Passw0rd", 17));
    Store(database, "SECRETS/MACHINE_LAST_CHANGE_TIME/CORP", "abcd");
    tdb_close(database);
  }

  static void Store(tdb_context* database, std::string key, std::string value) {
    EXPECT_EQ(tdb_store(database, {reinterpret_cast<unsigned char*>(key.data()), key.size()},
                        {reinterpret_cast<unsigned char*>(value.data()), value.size()}, TDB_REPLACE),
              0);
  }

  std::unique_ptr<testsupport::SmallFileSystem> samba_;
};

TEST_F(LeaveTest, TheMachinesSecretsAreRemoved) {
  EXPECT_EQ(RunLeave(), 0U);
  EXPECT_EQ(MachinePasswordTime("CORP"), std::nullopt);
  EXPECT_FALSE(LoadState().joined);
}

TEST_F(LeaveTest, TheMachinesSecretsAreRemovedUnderTheDistributionsSmbConf) {
  testsupport::CopyFile(paths::kDistributionSmbConf, paths::kSmbConf);
  EXPECT_EQ(RunLeave(), 0U);
  EXPECT_EQ(MachinePasswordTime("CORP"), std::nullopt);
}

TEST_F(LeaveTest, AHostWhoseSecretsAreGoneMayLeave) {
  testsupport::RemoveFile(paths::kSecrets);
  EXPECT_EQ(RunLeave(), 0U);
  EXPECT_FALSE(LoadState().joined);
}

TEST_F(LeaveTest, SecretsThatCannotBeWrittenKeepTheHostAMember) {
  ASSERT_EQ(mount(SECRETS_FOLDER.c_str(), SECRETS_FOLDER.c_str(), nullptr, MS_BIND, nullptr), 0);
  ASSERT_EQ(mount(nullptr, SECRETS_FOLDER.c_str(), nullptr, MS_REMOUNT | MS_BIND | MS_RDONLY, nullptr), 0);
  EXPECT_EQ(RunLeave(), 1359U);
  EXPECT_TRUE(LoadState().joined);
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
  EXPECT_TRUE(MachinePasswordTime("CORP").has_value());
}

TEST_F(LeaveTest, SecretsForWhoseRemovalTheDiskIsTooFullKeepTheHostAMember) {
  const std::string secrets = testsupport::ReadFile(paths::kSecrets);
  const testsupport::SmallFileSystem disk(SECRETS_FOLDER, secrets.size());
  testsupport::WriteFile(paths::kSecrets, secrets);
  EXPECT_EQ(RunLeave(), 1359U);
  EXPECT_TRUE(LoadState().joined);
  EXPECT_FALSE(testsupport::Exists(paths::kJournal));
  EXPECT_TRUE(MachinePasswordTime("CORP").has_value());
}

}  // namespace
}  // namespace sambaprovider
