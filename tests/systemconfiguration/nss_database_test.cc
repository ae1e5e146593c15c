#include <gtest/gtest.h>

#include <string>
#include <utility>
#include <vector>

#include "support/expect_throw_what.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

// Written out again, so that a slip in the product's table shows.
const std::vector<std::pair<unsigned, std::string>> keywords = {
    {1, "passwd"},    {2, "group"},       {3, "shadow"},     {4, "hosts"},      {5, "netmasks"},
    {6, "networks"},  {7, "protocols"},   {8, "services"},   {9, "ethers"},     {10, "rpc"},
    {11, "netgroup"}, {12, "bootparams"}, {13, "publickey"}, {14, "automount"}, {15, "aliases"}};

NSSDatabase FromNumber(unsigned number) {
  return NSSDatabase(static_cast<NSSDatabase::Database>(number));
}

unsigned NumberOf(const NSSDatabase& database) {
  return static_cast<NSSDatabase::Database>(database);
}

std::string TextOf(const NSSDatabase& database) {
  return static_cast<std::string>(database);
}

TEST(NSSDatabaseTest, EveryKeywordGivesItsNumber) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(NumberOf(NSSDatabase(word)), number) << word;
}

TEST(NSSDatabaseTest, EveryNumberGivesItsKeyword) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(TextOf(FromNumber(number)), word);
}

TEST(NSSDatabaseTest, EnumeratorsHaveTheirNumbers) {
  const std::vector<NSSDatabase::Database> enumerators = {
      NSSDatabase::Passwd,    NSSDatabase::Group,     NSSDatabase::Shadow,    NSSDatabase::Hosts,
      NSSDatabase::Netmasks,  NSSDatabase::Networks,  NSSDatabase::Protocols, NSSDatabase::Services,
      NSSDatabase::Ethers,    NSSDatabase::Rpc,       NSSDatabase::Netgroup,  NSSDatabase::Bootparams,
      NSSDatabase::Publickey, NSSDatabase::Automount, NSSDatabase::Aliases};
  for (unsigned index = 0; index < enumerators.size(); ++index) {
    EXPECT_EQ(unsigned{enumerators[index]}, index + 1);
  }
}

TEST(NSSDatabaseTest, TheEnumerationTakesThirtyTwoBits) {
  EXPECT_EQ(sizeof(NSSDatabase::Database), 4U);
}

TEST(NSSDatabaseTest, ADefaultConstructedDatabaseHasNoKeyword) {
  EXPECT_THROW_WHAT(TextOf(NSSDatabase()), InvalidDatabaseException, "Invalid Database: ");
}

TEST(NSSDatabaseTest, AnUnknownWordIsRefused) {
  EXPECT_THROW_WHAT(NSSDatabase("sudoers"), InvalidDatabaseException, "Invalid Database: sudoers");
}

TEST(NSSDatabaseTest, CaseMatters) {
  EXPECT_THROW_WHAT(NSSDatabase("Passwd"), InvalidDatabaseException, "Invalid Database: Passwd");
}

TEST(NSSDatabaseTest, TheEmptyStringIsNoDatabase) {
  EXPECT_THROW_WHAT(NSSDatabase(std::string()), InvalidDatabaseException, "Invalid Database: ");
}

TEST(NSSDatabaseTest, TakesAnAssignedValue) {
  NSSDatabase database;
  database = NSSDatabase::Rpc;
  EXPECT_EQ(NumberOf(database), 10U);
}

TEST(NSSDatabaseTest, TakesAnAssignedWord) {
  NSSDatabase database;
  database = "aliases";
  EXPECT_EQ(NumberOf(database), 15U);
}

TEST(NSSDatabaseTest, IsUnchangedWhenAnAssignedWordIsNoDatabase) {
  NSSDatabase database(NSSDatabase::Group);
  EXPECT_THROW_WHAT(database = "groups", InvalidDatabaseException, "Invalid Database: groups");
  EXPECT_EQ(NumberOf(database), 2U);
}

TEST(NSSDatabaseTest, EqualsADatabaseOfTheSameValue) {
  EXPECT_TRUE(NSSDatabase(NSSDatabase::Hosts) == NSSDatabase("hosts"));
  EXPECT_FALSE(NSSDatabase(NSSDatabase::Hosts) == NSSDatabase("shadow"));
}

TEST(NSSDatabaseTest, ComparesWithTheDatabaseThatAWordMeans) {
  EXPECT_TRUE(NSSDatabase(NSSDatabase::Hosts) == "hosts");
  EXPECT_FALSE(NSSDatabase(NSSDatabase::Hosts) == "shadow");
}

TEST(NSSDatabaseTest, CannotBeComparedWithAWordThatIsNoDatabase) {
  EXPECT_THROW_WHAT(NSSDatabase(NSSDatabase::Hosts) == "hosts:", InvalidDatabaseException,
                    "Invalid Database: hosts:");
}

TEST(NSSDatabaseTest, ConstantDatabasesCompareFromEitherSide) {
  const NSSDatabase database("hosts");
  EXPECT_TRUE(database == NSSDatabase::Hosts);
  EXPECT_TRUE(NSSDatabase::Hosts == database);
  EXPECT_TRUE(std::string("hosts") == database);
  EXPECT_TRUE(database != NSSDatabase::Group);
}

TEST(NSSDatabaseTest, AValueWithoutKeywordShortensItsMessageByItself) {
  EXPECT_THROW_WHAT(TextOf(FromNumber(16)), InvalidDatabaseException, ": ");
  EXPECT_THROW_WHAT(TextOf(FromNumber(17)), InvalidDatabaseException, " ");
  EXPECT_THROW_WHAT(TextOf(FromNumber(18)), InvalidDatabaseException, "");
}

TEST(NSSDatabaseTest, AnyLargerValueStillThrows) {
  EXPECT_THROW(TextOf(FromNumber(19)), InvalidDatabaseException);
  EXPECT_THROW(TextOf(FromNumber(0xffffffffU)), InvalidDatabaseException);
}

}  // namespace
}  // namespace SystemConfiguration
