// A damaged configuration store is reported. It never passes for an empty one, and is never written over.
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <vector>

#include "orvconfigstore/config_store.h"
#include "support/files.h"

namespace {

using OrvConfigStore::ConfigStore;
using OrvConfigStore::ConfigStoreException;
using OrvConfigStore::ConfigStoreObject;
using OrvConfigStore::ConfigStoreObjectId;

const std::string kDatabase = "/var/lib/quenix/configstore.db";
const std::string kJournal = kDatabase + "-journal";
const std::string kPrefix = "The configuration store '" + kDatabase + "' cannot be used: ";

const ConfigStoreObjectId& JoinedDomain() {
  static const ConfigStoreObjectId id("active_directory", "identity", "orv");
  return id;
}

std::shared_ptr<ConfigStore> Store() {
  return ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace);
}

void Put(const ConfigStoreObjectId& id, const std::string& value) {
  const auto object = std::make_shared<ConfigStoreObject>(id);
  object->SetValue("domain_name", value);
  object->SetValue("auth_proxy_address", "");
  Store()->PutObject(object, 0);
}

/// What the store answers: the value, or "absent", or the failure's text.
std::string Answer() {
  try {
    const auto object = Store()->GetObject(JoinedDomain());
    std::string value;
    return object && object->GetValue("domain_name", &value) ? value : "absent";
  } catch (const ConfigStoreException& exception) {
    return exception.what();
  }
}

std::string PutAnswer() {
  try {
    Put(JoinedDomain(), "other.example");
    return "written";
  } catch (const ConfigStoreException& exception) {
    return exception.what();
  }
}

void Execute(const std::string& sql) {
  sqlite3* connection = nullptr;
  ASSERT_EQ(sqlite3_open(kDatabase.c_str(), &connection), SQLITE_OK);
  EXPECT_EQ(sqlite3_exec(connection, sql.c_str(), nullptr, nullptr, nullptr), SQLITE_OK)
      << sqlite3_errmsg(connection);
  sqlite3_close(connection);
}

class ConfigStoreDamageTest : public testing::Test {
 protected:
  void SetUp() override {
    Put(JoinedDomain(), "corp.example");
    Put(ConfigStoreObjectId("auth_proxy_certificate", "identity", "orv"), "thumbprint");
    whole_ = testsupport::ReadFile(kDatabase);
  }

  /// Neither reading nor writing takes the file in `content`, and both leave it as it is.
  static void ExpectRefused(const std::string& content, const std::string& reason) {
    testsupport::WriteFile(kDatabase, content);
    EXPECT_EQ(Answer(), kPrefix + reason);
    EXPECT_EQ(PutAnswer(), kPrefix + reason);
    EXPECT_THROW(Store()->RemoveObject(JoinedDomain()), ConfigStoreException);
    EXPECT_TRUE(testsupport::ReadFile(kDatabase) == content);
  }

  std::string whole_;
};

TEST_F(ConfigStoreDamageTest, AnEmptyFileIsDamage) {
  ExpectRefused("", "it is damaged: the end of the file is missing");
}

TEST_F(ConfigStoreDamageTest, ATruncatedFileIsDamage) {
  ExpectRefused(whole_.substr(0, whole_.size() - 4096), "database disk image is malformed");
}

TEST_F(ConfigStoreDamageTest, ATextFileIsDamage) {
  ExpectRefused(std::string(8192, 'x'), "it is damaged, or not a configuration store");
}

TEST_F(ConfigStoreDamageTest, ADatabaseOfAnotherProgramIsRefused) {
  testsupport::RemoveFile(kDatabase);
  Execute("CREATE TABLE object (key TEXT)");
  ExpectRefused(testsupport::ReadFile(kDatabase), "it is damaged, or not a configuration store");
}

TEST_F(ConfigStoreDamageTest, ADatabaseOfANewerVersionIsRefused) {
  Execute("PRAGMA user_version = 2");
  ExpectRefused(testsupport::ReadFile(kDatabase), "it is damaged, or a newer version has written it");
}

TEST_F(ConfigStoreDamageTest, AWriteAheadLogIsRefused) {
  Execute("PRAGMA journal_mode = WAL");
  ExpectRefused(testsupport::ReadFile(kDatabase), "it is damaged, or its journal mode has been changed");
  EXPECT_EQ(testsupport::NamesIn("/var/lib/quenix"), std::vector<std::string>{"configstore.db"});
}

TEST_F(ConfigStoreDamageTest, AChangedValueIsDamage) {
  Execute("UPDATE field SET value = CAST('evil.example' AS BLOB) WHERE name = 'domain_name' AND object = 1");
  EXPECT_EQ(Answer(), kPrefix + "it is damaged: the object 'active_directory' is not as it was written");
}

TEST_F(ConfigStoreDamageTest, AMissingFieldIsDamage) {
  Execute("DELETE FROM field WHERE name = 'domain_name' AND object = 1");
  EXPECT_EQ(Answer(), kPrefix + "it is damaged: the object 'active_directory' is not as it was written");
}

TEST_F(ConfigStoreDamageTest, VerifyFindsDamageInAnObjectThatNobodyAskedFor) {
  Execute("DELETE FROM field WHERE object = 2");
  EXPECT_EQ(Answer(), "corp.example");
  EXPECT_THROW(Store()->Verify(), ConfigStoreException);
}

TEST_F(ConfigStoreDamageTest, NoDamagedByteChangesAnAnswer) {
  for (std::size_t position = 0; position < whole_.size(); ++position) {
    // Most of the file is unused room, which is all zero.
    if (position >= 100 && whole_[position] == '\0') continue;
    for (const int flip : {0x01, 0x80, 0xff}) {
      std::string damaged = whole_;
      damaged[position] = static_cast<char>(damaged[position] ^ flip);
      testsupport::WriteFile(kDatabase, damaged);
      const std::string answer = Answer();
      ASSERT_TRUE(answer == "corp.example" || answer.compare(0, kPrefix.size(), kPrefix) == 0)
          << "byte " << position << " flipped by " << flip << ": " << answer;
    }
  }
}

TEST_F(ConfigStoreDamageTest, NoTruncationChangesAnAnswer) {
  for (std::size_t size = 0; size < whole_.size(); size += 61) {
    testsupport::WriteFile(kDatabase, whole_.substr(0, size));
    ASSERT_EQ(Answer().compare(0, kPrefix.size(), kPrefix), 0) << "cut off at " << size;
  }
}

TEST_F(ConfigStoreDamageTest, ADirectoryInTheDatabasesPlaceIsReported) {
  testsupport::RemoveFile(kDatabase);
  ASSERT_EQ(mkdir(kDatabase.c_str(), 0755), 0);
  EXPECT_EQ(Answer().compare(0, kPrefix.size(), kPrefix), 0) << Answer();
  EXPECT_EQ(PutAnswer().compare(0, kPrefix.size(), kPrefix), 0) << PutAnswer();
}

TEST_F(ConfigStoreDamageTest, ALinkThatLeadsNowhereIsNoEmptyStore) {
  testsupport::RemoveFile(kDatabase);
  ASSERT_EQ(symlink("/run/gone/store.db", kDatabase.c_str()), 0);
  EXPECT_EQ(Answer(), kPrefix + "it is a link to a file that is not there");
  EXPECT_EQ(PutAnswer(), kPrefix + "it is a link to a file that is not there");
}

TEST_F(ConfigStoreDamageTest, AJournalWithoutItsDatabaseIsNoEmptyStore) {
  testsupport::RemoveFile(kDatabase);
  testsupport::WriteFile(kJournal, "journal");
  EXPECT_EQ(Answer(), kPrefix + "it is gone, but its journal '" + kJournal + "' is there");
  EXPECT_EQ(PutAnswer(), kPrefix + "it is gone, but its journal '" + kJournal + "' is there");
}

TEST_F(ConfigStoreDamageTest, AFileInTheDirectorysPlaceIsReported) {
  testsupport::RemoveFile(kDatabase);
  ASSERT_EQ(symlink("/run/velmor-sandbox/store.db", kDatabase.c_str()), 0);
  EXPECT_EQ(Answer(), kPrefix + "Not a directory");
}

}  // namespace
