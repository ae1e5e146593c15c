// What the configuration store keeps, gives back and refuses.
#include "orvconfigstore/config_store.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstddef>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "support/expect_throw_what.h"
#include "support/files.h"

namespace {

using OrvConfigStore::ConfigStore;
using OrvConfigStore::ConfigStoreException;
using OrvConfigStore::ConfigStoreObject;
using OrvConfigStore::ConfigStoreObjectId;
using OrvConfigStore::StoreObject;

const char kDatabase[] = "/var/lib/quenix/configstore.db";

std::shared_ptr<ConfigStore> Store() {
  return ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace);
}

ConfigStoreObjectId Id(const char* key) {
  return ConfigStoreObjectId(key, "identity", "orv");
}

std::shared_ptr<ConfigStoreObject> Object(const char* key, const char* field, const std::string& value) {
  const auto object = std::make_shared<ConfigStoreObject>(Id(key));
  object->SetValue(field, value);
  return object;
}

std::string ValueOf(const StoreObject& object, const char* field) {
  std::string value = "untouched";
  object.GetValue(field, &value);
  return value;
}

/// The position of a virtual operation, from 0, in the table that callers use.
template <typename Operation>
std::ptrdiff_t SlotOf(Operation operation) {
  struct {
    std::ptrdiff_t entry;
    std::ptrdiff_t adjustment;
  } pointer{};
  static_assert(sizeof(operation) == sizeof(pointer));
  std::memcpy(&pointer, &operation, sizeof(pointer));
  // Some machines mark a virtual operation in the lowest bit of the entry.
  return (pointer.entry & ~std::ptrdiff_t{1}) / static_cast<std::ptrdiff_t>(sizeof(void*));
}

TEST(ConfigStoreTest, GetIsTheFirstPutTheFifthAndRemoveTheTenthVirtualOperation) {
  EXPECT_EQ(SlotOf(&ConfigStore::GetObject), 0);
  EXPECT_EQ(SlotOf(&ConfigStore::PutObject), 4);
  EXPECT_EQ(SlotOf(&ConfigStore::RemoveObject), 9);
}

TEST(ConfigStoreTest, ReturnsWhatWasPut) {
  Store()->PutObject(Object("active_directory", "domain_name", "corp.example"), 0);
  const auto object = Store()->GetObject(Id("active_directory"));
  ASSERT_TRUE(object);
  EXPECT_EQ(ValueOf(*object, "domain_name"), "corp.example");
  EXPECT_EQ(object->GetId(), Id("active_directory"));
}

TEST(ConfigStoreTest, GivesNoObjectForAnUnknownIdentity) {
  Store()->PutObject(Object("one", "field", "value"), 0);
  EXPECT_FALSE(Store()->GetObject(Id("other")));
  EXPECT_FALSE(Store()->GetObject(ConfigStoreObjectId("one", "other", "orv")));
  EXPECT_FALSE(Store()->GetObject(ConfigStoreObjectId("one", "identity", "other")));
}

TEST(ConfigStoreTest, LeavesTheOutputAloneForAnAbsentField) {
  Store()->PutObject(Object("one", "field", "value"), 0);
  const auto object = Store()->GetObject(Id("one"));
  std::string out = "before";
  EXPECT_FALSE(object->GetValue("other", &out));
  EXPECT_EQ(out, "before");
}

TEST(ConfigStoreTest, TellsAnEmptyFieldFromAnAbsentOne) {
  Store()->PutObject(Object("one", "field", ""), 0);
  const auto object = Store()->GetObject(Id("one"));
  std::string out = "before";
  EXPECT_TRUE(object->GetValue("field", &out));
  EXPECT_EQ(out, "");
}

TEST(ConfigStoreTest, AnObjectWithoutFieldsExists) {
  Store()->PutObject(std::make_shared<ConfigStoreObject>(Id("one")), 0);
  ASSERT_TRUE(Store()->GetObject(Id("one")));
  EXPECT_TRUE(Store()->GetObject(Id("one"))->GetValues().empty());
}

TEST(ConfigStoreTest, PutReplacesTheObjectWhole) {
  Store()->PutObject(Object("one", "first", "1"), 0);
  Store()->PutObject(Object("one", "second", "2"), 0);
  const auto object = Store()->GetObject(Id("one"));
  EXPECT_EQ(ValueOf(*object, "first"), "untouched");
  EXPECT_EQ(ValueOf(*object, "second"), "2");
}

TEST(ConfigStoreTest, KeepsEveryByteOfAValue) {
  std::string value;
  for (int byte = 0; byte < 256; ++byte) value += static_cast<char>(byte);
  for (int doubling = 0; doubling < 10; ++doubling) value += value;
  Store()->PutObject(Object("one", "field", value), 0);
  EXPECT_TRUE(ValueOf(*Store()->GetObject(Id("one")), "field") == value);
}

TEST(ConfigStoreTest, AnObjectIsACopy) {
  Store()->PutObject(Object("one", "field", "value"), 0);
  Store()->GetObject(Id("one"))->SetValue("field", "changed");
  EXPECT_EQ(ValueOf(*Store()->GetObject(Id("one")), "field"), "value");
}

TEST(ConfigStoreTest, RemovesTheObjectAndNoOther) {
  Store()->PutObject(Object("one", "field", "1"), 0);
  Store()->PutObject(Object("two", "field", "2"), 0);
  Store()->RemoveObject(Id("one"));
  EXPECT_FALSE(Store()->GetObject(Id("one")));
  EXPECT_EQ(ValueOf(*Store()->GetObject(Id("two")), "field"), "2");
}

TEST(ConfigStoreTest, RemovingAnAbsentObjectDoesNothing) {
  Store()->PutObject(Object("two", "field", "2"), 0);
  Store()->RemoveObject(Id("one"));
  EXPECT_EQ(Store()->CountObjects(), 1U);
}

TEST(ConfigStoreTest, NamespacesDoNotSeeEachOther) {
  Store()->PutObject(Object("one", "field", "global"), 0);
  const auto other = ConfigStore::GetStore("other");
  EXPECT_FALSE(other->GetObject(Id("one")));
  other->PutObject(Object("one", "field", "other"), 0);
  other->RemoveObjects("identity", "orv");
  EXPECT_EQ(ValueOf(*Store()->GetObject(Id("one")), "field"), "global");
  EXPECT_EQ(other->GetNamespace(), "other");
}

TEST(ConfigStoreTest, ListsTheObjectsOfAGroupByKey) {
  Store()->PutObjects({Object("b", "f", "1"), Object("a", "f", "2")}, 0);
  Store()->PutObject(std::make_shared<ConfigStoreObject>(ConfigStoreObjectId("c", "other", "orv")), 0);
  const std::vector<ConfigStoreObjectId> ids = Store()->ListObjects("identity", "orv");
  ASSERT_EQ(ids.size(), 2U);
  EXPECT_EQ(ids[0], Id("a"));
  EXPECT_EQ(ids[1], Id("b"));
  EXPECT_EQ(Store()->CountObjects(), 3U);
  EXPECT_TRUE(Store()->HasObject(Id("a")));
  EXPECT_FALSE(Store()->HasObject(Id("c")));
}

TEST(ConfigStoreTest, RemovesTheObjectsOfAGroup) {
  Store()->PutObjects({Object("b", "f", "1"), Object("a", "f", "2")}, 0);
  Store()->PutObject(std::make_shared<ConfigStoreObject>(ConfigStoreObjectId("c", "other", "orv")), 0);
  EXPECT_EQ(Store()->RemoveObjects("identity", "orv"), 2U);
  EXPECT_EQ(Store()->CountObjects(), 1U);
}

TEST(ConfigStoreTest, PutsAllObjectsOrNone) {
  EXPECT_THROW(Store()->PutObjects({Object("a", "f", "1"), nullptr}, 0), ConfigStoreException);
  EXPECT_EQ(Store()->CountObjects(), 0U);
}

TEST(ConfigStoreTest, AHostWithoutADatabaseHasAnEmptyStore) {
  EXPECT_FALSE(Store()->GetObject(Id("one")));
  EXPECT_FALSE(Store()->HasObject(Id("one")));
  EXPECT_EQ(Store()->CountObjects(), 0U);
  EXPECT_TRUE(Store()->ListObjects("identity", "orv").empty());
  EXPECT_NO_THROW(Store()->RemoveObject(Id("one")));
  EXPECT_EQ(Store()->RemoveObjects("identity", "orv"), 0U);
  EXPECT_NO_THROW(Store()->Verify());
}

TEST(ConfigStoreTest, OnlyPuttingCreatesAFile) {
  Store()->GetObject(Id("one"));
  Store()->RemoveObject(Id("one"));
  Store()->Verify();
  EXPECT_TRUE(testsupport::NamesIn("/var/lib/quenix").empty());
}

TEST(ConfigStoreTest, LeavesNothingBesideTheDatabase) {
  Store()->PutObject(Object("one", "field", "value"), 0);
  Store()->GetObject(Id("one"));
  Store()->RemoveObject(Id("one"));
  EXPECT_EQ(testsupport::NamesIn("/var/lib/quenix"), std::vector<std::string>{"configstore.db"});
}

TEST(ConfigStoreTest, TheDatabaseIsReadableForEverybodyWhateverTheUmask) {
  umask(0077);
  Store()->PutObject(Object("one", "field", "value"), 0);
  EXPECT_EQ(testsupport::ModeOf(kDatabase), 0644U);
  EXPECT_EQ(Store()->GetPath(), kDatabase);
}

TEST(ConfigStoreTest, IsFoundThroughALink) {
  Store()->PutObject(Object("one", "field", "value"), 0);
  testsupport::MakeFolders("/run/moved");
  testsupport::CopyFile(kDatabase, "/run/moved/store.db");
  testsupport::RemoveFile(kDatabase);
  ASSERT_EQ(symlink("/run/moved/store.db", kDatabase), 0);
  EXPECT_EQ(ValueOf(*Store()->GetObject(Id("one")), "field"), "value");
}

TEST(ConfigStoreTest, RefusesFlagsThatHaveNoMeaning) {
  EXPECT_THROW_WHAT(Store()->PutObject(Object("a", "f", "1"), 1), ConfigStoreException,
                    "The configuration store knows no flags but 0");
}

TEST(ConfigStoreTest, RefusesAnEmptyReference) {
  EXPECT_THROW_WHAT(Store()->PutObject(nullptr, 0), ConfigStoreException,
                    "The configuration store was given no object to put");
}

TEST(ConfigStoreTest, RefusesAnEmptyNamespace) {
  EXPECT_THROW_WHAT(ConfigStore::GetStore(""), ConfigStoreException,
                    "A configuration store needs a namespace");
}

TEST(ConfigStoreTest, AnIdentityNeedsAllItsStrings) {
  EXPECT_THROW_WHAT(ConfigStoreObjectId(nullptr, "g", "c"), ConfigStoreException,
                    "A configuration store object needs a key");
  EXPECT_THROW_WHAT(ConfigStoreObjectId("k", "", "c"), ConfigStoreException,
                    "A configuration store object needs a group");
  EXPECT_THROW_WHAT(ConfigStoreObjectId("k", "g", nullptr), ConfigStoreException,
                    "A configuration store object needs a component");
}

TEST(ConfigStoreTest, AFieldNeedsAName) {
  ConfigStoreObject object(Id("one"));
  EXPECT_THROW_WHAT(object.SetValue("", "value"), ConfigStoreException,
                    "A configuration store object needs a field name");
}

TEST(ConfigStoreTest, ItsExceptionIsAHostManagementException) {
  try {
    ConfigStore::GetStore("");
    FAIL();
  } catch (const HostMgmt::Lib::HostMgmtException& exception) {
    EXPECT_STREQ(exception.what(), "A configuration store needs a namespace");
  }
}

}  // namespace
