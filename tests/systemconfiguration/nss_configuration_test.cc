#include <gtest/gtest.h>

#include <deque>
#include <list>
#include <sstream>
#include <stdexcept>
#include <string>

#include "support/expect_throw_what.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::ReadConfiguration;
using testsupport::Written;

// What a text is written back as.
std::string RoundTrip(const std::string& text) {
  return Written(ReadConfiguration(text));
}

TEST(NSSConfigurationTest, AnEmptyInputWritesNothing) {
  EXPECT_EQ(RoundTrip(""), "");
}

TEST(NSSConfigurationTest, AnEmptyInputLeavesTheConfigurationAsItWas) {
  NSSConfiguration configuration = ReadConfiguration("group: files\n");
  std::istringstream stream("");
  stream >> configuration;
  EXPECT_EQ(Written(configuration), "group: files\n");
}

TEST(NSSConfigurationTest, SpacingBecomesSingleBlanks) {
  EXPECT_EQ(RoundTrip("passwd:     files\n"), "passwd: files\n");
  EXPECT_EQ(RoundTrip("\t passwd:\tfiles \t nis\n"), "passwd: files nis\n");
}

TEST(NSSConfigurationTest, ServicesKeepTheirOrder) {
  NSSConfiguration configuration = ReadConfiguration("hosts: dns files\n");
  ASSERT_EQ(configuration[NSSDatabase::Hosts].size(), 2U);
  EXPECT_EQ(configuration[NSSDatabase::Hosts][0].module(), "dns");
  EXPECT_EQ(configuration[NSSDatabase::Hosts][1].module(), "files");
}

TEST(NSSConfigurationTest, ACriterionBelongsToTheServiceBeforeItAndLosesTheRest) {
  NSSConfiguration configuration = ReadConfiguration("hosts: files [NOTFOUND=return] dns\n");
  ASSERT_EQ(configuration[NSSDatabase::Hosts].size(), 1U);
  EXPECT_EQ(configuration[NSSDatabase::Hosts][0].module(), "files");
  EXPECT_EQ(configuration[NSSDatabase::Hosts][0].parameters(), std::list<std::string>{"NOTFOUND=return"});
  EXPECT_EQ(Written(configuration), "hosts: files [NOTFOUND=return]\n");
}

TEST(NSSConfigurationTest, WordsOfACriterionAreSplit) {
  EXPECT_EQ(RoundTrip("hosts: dns [ !UNAVAIL=return \t SUCCESS=continue ]\n"),
            "hosts: dns [!UNAVAIL=return SUCCESS=continue]\n");
}

TEST(NSSConfigurationTest, AnEmptyCriterionGivesNoParameters) {
  NSSConfiguration configuration = ReadConfiguration("hosts: dns []\n");
  EXPECT_TRUE(configuration[NSSDatabase::Hosts][0].parameters().empty());
}

TEST(NSSConfigurationTest, ACriterionThatIsNeverClosedGoesToTheEndAndIsReadAgainAsServices) {
  NSSConfiguration configuration = ReadConfiguration("hosts: dns [a b\n");
  EXPECT_EQ(configuration[NSSDatabase::Hosts][0].parameters(), (std::list<std::string>{"a", "b"}));
  EXPECT_EQ(Written(configuration), "hosts: dns [a b] [a b\n");
}

// The character behind the blank has the index 10 and the bracket closes at 12: reading goes on at 22.
TEST(NSSConfigurationTest, ReadingGoesOnFarBehindACriterionPerhapsInsideAWord) {
  EXPECT_EQ(RoundTrip("passwd: x [a] 45678 01cdef gh\n"), "passwd: x [a] cdef gh\n");
}

TEST(NSSConfigurationTest, PlacesAreCountedFromTheFirstCharacterThatIsNotTrimmed) {
  EXPECT_EQ(RoundTrip("\t\r passwd: x [a] 45678 01cdef gh\n"), "passwd: x [a] cdef gh\n");
}

TEST(NSSConfigurationTest, AVerticalTabIsNotTrimmedAndCounts) {
  EXPECT_EQ(RoundTrip("\vpasswd: x [a] 45678 01cdef gh\n"), "passwd: x [a] def gh\n");
}

TEST(NSSConfigurationTest, APlaceExactlyAtTheEndEndsTheLine) {
  EXPECT_EQ(RoundTrip("passwd: x [a] 45678 01\n"), "passwd: x [a]\n");
}

TEST(NSSConfigurationTest, ABracketFurtherOnMovesThePlaceEvenWithoutACriterion) {
  EXPECT_EQ(RoundTrip("hosts: files  [NOTFOUND=return] dns\n"), "hosts: files\n");
  EXPECT_EQ(RoundTrip("hosts: files dns [NOTFOUND=return]\n"), "hosts: files\n");
}

TEST(NSSConfigurationTest, AnySeparatorOfOneCharacterLeadsToACriterion) {
  EXPECT_EQ(RoundTrip("hosts: files\t[a]\n"), "hosts: files [a]\n");
  EXPECT_EQ(RoundTrip("hosts: files\v[a]\n"), "hosts: files [a]\n");
}

TEST(NSSConfigurationTest, ACriterionThatTouchesItsServiceIsPartOfIt) {
  NSSConfiguration configuration = ReadConfiguration("hosts: files[a]\n");
  EXPECT_EQ(configuration[NSSDatabase::Hosts][0].module(), "files[a]");
}

TEST(NSSConfigurationTest, UnknownDatabasesAreSkipped) {
  EXPECT_EQ(RoundTrip("foo: files\npasswd: files\nPasswd: nis\n"), "passwd: files\n");
}

TEST(NSSConfigurationTest, CommentsAreSkippedIndentedOrNot) {
  EXPECT_EQ(RoundTrip("#hosts: files\n  # hosts: files\n\t#hosts: files\n"), "");
}

TEST(NSSConfigurationTest, BlankLinesAreSkipped) {
  EXPECT_EQ(RoundTrip("\n   \n\t\r\n\ngroup: nis\n"), "group: nis\n");
}

TEST(NSSConfigurationTest, ABlankBeforeTheColonDropsTheLine) {
  EXPECT_EQ(RoundTrip("passwd : files\n"), "");
}

TEST(NSSConfigurationTest, NoBlankBehindTheColonDropsTheLine) {
  EXPECT_EQ(RoundTrip("passwd:files\n"), "");
}

TEST(NSSConfigurationTest, AnyLastCharacterPassesForTheColon) {
  EXPECT_EQ(RoundTrip("passwd; files\n"), "passwd: files\n");
}

TEST(NSSConfigurationTest, AWordOfOneCharacterIsNoDatabase) {
  EXPECT_EQ(RoundTrip(": files\n"), "");
}

// The vertical tab is not trimmed, but it is white space to the reading of words.
TEST(NSSConfigurationTest, ALineWithoutAnyWordIsSkipped) {
  EXPECT_EQ(RoundTrip("\v\f\v\n"), "");
}

TEST(NSSConfigurationTest, ADatabaseOnTwoLinesCollectsBoth) {
  EXPECT_EQ(RoundTrip("group: files\nhosts: dns\ngroup: nis\n"), "group: files nis\nhosts: dns\n");
}

TEST(NSSConfigurationTest, ADatabaseWithoutServicesIsAbsent) {
  EXPECT_EQ(RoundTrip("passwd:\n"), "");
  EXPECT_EQ(RoundTrip("passwd: \t \n"), "");
}

TEST(NSSConfigurationTest, DatabasesAreWrittenByTheirNumbers) {
  EXPECT_EQ(RoundTrip("aliases: a\nrpc: b\nhosts: c\npasswd: d\n"),
            "passwd: d\nhosts: c\nrpc: b\naliases: a\n");
}

TEST(NSSConfigurationTest, ReadingAppendsToWhatIsThere) {
  NSSConfiguration configuration = ReadConfiguration("group: files\n");
  std::istringstream stream("group: nis\n");
  stream >> configuration;
  EXPECT_EQ(Written(configuration), "group: files nis\n");
}

TEST(NSSConfigurationTest, OneTrailingBlankThrows) {
  EXPECT_THROW(ReadConfiguration("passwd: files \n"), std::out_of_range);
}

TEST(NSSConfigurationTest, TwoTrailingBlanksDoNot) {
  EXPECT_EQ(RoundTrip("passwd: files  \n"), "passwd: files\n");
}

TEST(NSSConfigurationTest, LinesThatEndInACarriageReturnThrow) {
  EXPECT_THROW(ReadConfiguration("passwd: files\r\n"), std::out_of_range);
}

TEST(NSSConfigurationTest, ServicesBeforeTheFaultStay) {
  NSSConfiguration configuration;
  std::istringstream stream("group: nis\npasswd: files compat dns \nhosts: dns\n");
  EXPECT_THROW(stream >> configuration, std::out_of_range);
  EXPECT_EQ(Written(configuration), "passwd: files compat\ngroup: nis\n");
}

TEST(NSSConfigurationTest, AFaultLeavesTheStreamBehindItsLine) {
  NSSConfiguration configuration;
  std::istringstream stream("passwd: files \nhosts: dns\n");
  EXPECT_THROW(stream >> configuration, std::out_of_range);
  EXPECT_TRUE(stream.good());
  stream >> configuration;
  EXPECT_EQ(Written(configuration), "hosts: dns\n");
}

TEST(NSSConfigurationTest, TheLastLineNeedsNoLineEnd) {
  EXPECT_EQ(RoundTrip("passwd: files"), "passwd: files\n");
}

TEST(NSSConfigurationTest, IndexingMakesAnEmptyQueueThatIsWrittenAsItsKeyword) {
  NSSConfiguration configuration;
  EXPECT_TRUE(configuration[NSSDatabase::Shadow].empty());
  EXPECT_EQ(Written(configuration), "shadow:\n");
}

TEST(NSSConfigurationTest, IndexingGivesTheSameQueueEachTime) {
  NSSConfiguration configuration;
  std::deque<NSSService>& services = configuration[NSSDatabase::Shadow];
  configuration[NSSDatabase::Passwd];
  EXPECT_EQ(&configuration[NSSDatabase::Shadow], &services);
}

TEST(NSSConfigurationTest, ADatabaseWithoutKeywordCannotBeWritten) {
  NSSConfiguration configuration = ReadConfiguration("passwd: files\n");
  configuration[static_cast<NSSDatabase::Database>(16)].emplace_back("files");
  std::ostringstream stream;
  EXPECT_THROW_WHAT(stream << configuration, InvalidDatabaseException, ": ");
  EXPECT_EQ(stream.str(), "passwd: files\n");
}

TEST(NSSConfigurationTest, ACopyIsIndependent) {
  NSSConfiguration configuration = ReadConfiguration("passwd: files\n");
  NSSConfiguration copy = configuration;
  copy[NSSDatabase::Passwd].clear();
  EXPECT_EQ(Written(configuration), "passwd: files\n");
}

// Searching for the bracket anew for each of them would take minutes.
TEST(NSSConfigurationTest, ALineOfAMillionServicesIsRead) {
  std::string line = "passwd:";
  for (int service = 0; service < 1'000'000; ++service) line += " x";
  EXPECT_EQ(ReadConfiguration(line)[NSSDatabase::Passwd].size(), 1'000'000U);
}

}  // namespace
}  // namespace SystemConfiguration
