// What is read from Samba's secrets.

#include "helper/machine_password.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
extern "C" {
#include <tdb.h>
}

#include <string>

#include "support/files.h"

namespace sambaprovider {
namespace {

// Stores a record as Samba does: the key has no terminator, a time is four bytes with the lowest first.
void StoreSecret(std::string key, std::string value) {
  testsupport::MakeFolders("/var/lib/samba/private");
  tdb_context* const database =
      tdb_open("/var/lib/samba/private/secrets.tdb", 0, TDB_DEFAULT, O_RDWR | O_CREAT, 0600);
  ASSERT_NE(database, nullptr);
  const TDB_DATA name = {reinterpret_cast<unsigned char*>(key.data()), key.size()};
  const TDB_DATA data = {reinterpret_cast<unsigned char*>(value.data()), value.size()};
  EXPECT_EQ(tdb_store(database, name, data, TDB_REPLACE), 0);
  tdb_close(database);
}

TEST(MachinePasswordTest, AHostWithoutSecretsHasNone) {
  EXPECT_EQ(MachinePasswordTime("CORP"), std::nullopt);
}

TEST(MachinePasswordTest, TheTimeOfItsLastChangeIsRead) {
  StoreSecret("SECRETS/MACHINE_LAST_CHANGE_TIME/CORP", std::string("\x01\x02\x00\x69", 4));
  EXPECT_EQ(MachinePasswordTime("CORP"), 0x69000201);
}

TEST(MachinePasswordTest, TheDomainMayBeWrittenInAnyCase) {
  StoreSecret("SECRETS/MACHINE_LAST_CHANGE_TIME/CORP", std::string("\x01\x02\x00\x69", 4));
  EXPECT_TRUE(MachinePasswordTime("Corp").has_value());
}

TEST(MachinePasswordTest, AnotherDomainsSecretDoesNotCount) {
  StoreSecret("SECRETS/MACHINE_LAST_CHANGE_TIME/OTHER", std::string("\x01\x02\x00\x69", 4));
  EXPECT_EQ(MachinePasswordTime("CORP"), std::nullopt);
}

}  // namespace
}  // namespace sambaprovider
