#include "nss/switch_file.h"

#include <gtest/gtest.h>

#include "nss/words.h"

namespace velmorctltest {

namespace {

using velmorctl::LineFault;
using velmorctl::LookupAction;
using velmorctl::LookupStatus;
using velmorctl::ServiceMeaning;
using velmorctl::SwitchFile;
using velmorctl::SwitchLine;
using Meaning = std::vector<ServiceMeaning>;

struct ReadLine {
  const char* name;
  const char* text;
  Meaning services;
};

class SwitchLineTest : public ::testing::TestWithParam<ReadLine> {};

TEST_P(SwitchLineTest, HasTheServicesThatTheLibraryReads) {
  const SwitchFile file(GetParam().text);
  ASSERT_EQ(file.Lines().size(), 1U);
  EXPECT_EQ(file.Lines().front().database, "hosts");
  EXPECT_EQ(file.Lines().front().Meaning(), GetParam().services);
}

INSTANTIATE_TEST_SUITE_P(
    Each, SwitchLineTest,
    ::testing::Values(
        ReadLine{"OneService", "hosts: files\n", {{"files", {}}}}, ReadLine{"NoServices", "hosts:\n", {}},
        ReadLine{"NoBlankBehindTheColon", "hosts:files\n", {{"files", {}}}},
        ReadLine{"ABlankBeforeTheColon", "hosts : files\n", {{"files", {}}}},
        ReadLine{"BlanksBeforeTheDatabase", " \thosts: files\n", {{"files", {}}}},
        ReadLine{"TabsAndManyBlanks", "hosts:\t\tfiles   dns\t\n", {{"files", {}}, {"dns", {}}}},
        ReadLine{"ACarriageReturn", "hosts: files dns\r\n", {{"files", {}}, {"dns", {}}}},
        ReadLine{"ACriterion",
                 "hosts: files [NOTFOUND=return] dns\n",
                 {{"files", {"NOTFOUND=return"}}, {"dns", {}}}},
        ReadLine{"ANegatedCriterion",
                 "hosts: resolve [!UNAVAIL=return] dns\n",
                 {{"resolve", {"!UNAVAIL=return"}}, {"dns", {}}}},
        ReadLine{"SeveralWordsInACriterion",
                 "hosts: nis [ NOTFOUND=return  TRYAGAIN=continue ] dns\n",
                 {{"nis", {"NOTFOUND=return", "TRYAGAIN=continue"}}, {"dns", {}}}},
        ReadLine{"NoBlanksAroundACriterion",
                 "hosts: files[NOTFOUND=return]dns\n",
                 {{"files", {"NOTFOUND=return"}}, {"dns", {}}}},
        ReadLine{"ABracketWithoutAService", "hosts: [NOTFOUND=return] dns\n", {}},
        ReadLine{"TwoCriteria",
                 "hosts: files [NOTFOUND=return] [UNAVAIL=return] dns\n",
                 {{"files", {"NOTFOUND=return"}}}},
        ReadLine{"ACriterionWithoutMeaning", "hosts: files [FOUND=return] dns\n", {{"files", {}}}},
        ReadLine{"ACriterionWithoutAnEnd", "hosts: files [NOTFOUND=return dns\n", {{"files", {}}}},
        ReadLine{"AClosingBracketAlone", "hosts: files ] dns\n", {{"files", {}}, {"]", {}}, {"dns", {}}}},
        ReadLine{"ARemark", "hosts: files # dns\n", {{"files", {}}}},
        ReadLine{"NoColon", "hosts files\n", {{"files", {}}}},
        ReadLine{"TwoColons", "hosts:: files\n", {{"files", {}}}}),
    [](const auto& test) { return std::string(test.param.name); });

struct FaultyLine {
  const char* name;
  const char* text;
  LineFault::Kind kind;
  const char* value;
};

class LineFaultTest : public ::testing::TestWithParam<FaultyLine> {};

TEST_P(LineFaultTest, IsFound) {
  const SwitchFile file(GetParam().text);
  ASSERT_EQ(file.Lines().size(), 1U);
  ASSERT_EQ(file.Lines().front().faults.size(), 1U);
  EXPECT_EQ(file.Lines().front().faults.front().kind, GetParam().kind);
  EXPECT_EQ(file.Lines().front().faults.front().value, GetParam().value);
}

INSTANTIATE_TEST_SUITE_P(
    Each, LineFaultTest,
    ::testing::Values(FaultyLine{"NoDatabase", ": files\n", LineFault::Kind::NoDatabase, ": files"},
                      FaultyLine{"NoColon", "hosts files\n", LineFault::Kind::NoColon, "hosts "},
                      FaultyLine{"NoColonAndNoServices", "hosts\n", LineFault::Kind::NoColon, "hosts"},
                      FaultyLine{"ManyColons", "hosts: : files\n", LineFault::Kind::ManyColons, "hosts: : "},
                      FaultyLine{"LoneBracket", "hosts: [NOTFOUND=return] dns\n",
                                 LineFault::Kind::LoneBracket, "[NOTFOUND=return] dns"},
                      FaultyLine{"SecondBracket", "hosts: files [NOTFOUND=return] [X] dns\n",
                                 LineFault::Kind::LoneBracket, "[X] dns"},
                      FaultyLine{"BadCriterion", "hosts: files [FOUND=return] dns\n",
                                 LineFault::Kind::BadCriterion, "[FOUND=return]"},
                      FaultyLine{"EmptyCriterion", "hosts: files []\n", LineFault::Kind::BadCriterion, "[]"},
                      FaultyLine{"OpenCriterion", "hosts: files [NOTFOUND=return dns\n",
                                 LineFault::Kind::BadCriterion, "[NOTFOUND=return dns"},
                      FaultyLine{"Remark", "hosts: files # dns\n", LineFault::Kind::Remark, "# dns"},
                      FaultyLine{"NoNewline", "hosts: files", LineFault::Kind::NoNewline, "hosts: files"}),
    [](const auto& test) { return std::string(test.param.name); });

TEST(SwitchFileTest, PassesOverCommentsAndEmptyLines) {
  const SwitchFile file("# a comment\n\n \t\r\n  # another\nhosts: files\n");
  ASSERT_EQ(file.Lines().size(), 1U);
  EXPECT_EQ(file.Lines().front().number, 5);
}

TEST(SwitchFileTest, KnowsTheActionsOfACriterion) {
  const SwitchFile file("hosts: files [!UNAVAIL=return NOTFOUND=merge]\n");
  const velmorctl::Actions actions = file.Lines().front().services.front().actions;
  EXPECT_EQ(actions.For(LookupStatus::Success), LookupAction::Return);
  EXPECT_EQ(actions.For(LookupStatus::NotFound), LookupAction::Merge);
  EXPECT_EQ(actions.For(LookupStatus::Unavailable), LookupAction::Continue);
  EXPECT_EQ(actions.For(LookupStatus::TryAgain), LookupAction::Return);
}

TEST(SwitchFileTest, LetsTheLastLineOfADatabaseCount) {
  const SwitchFile file("passwd: files\ngroup: files\npasswd: nis\n");
  EXPECT_FALSE(file.Counts(file.Lines()[0]));
  EXPECT_TRUE(file.Counts(file.Lines()[1]));
  EXPECT_TRUE(file.Counts(file.Lines()[2]));
}

TEST(SwitchFileTest, LetsNoLineCountThatTheLibraryDoesNotRead) {
  const SwitchFile file("passwd: files\npasswd: nis");
  EXPECT_TRUE(file.Counts(file.Lines()[0]));
  EXPECT_FALSE(file.Counts(file.Lines()[1]));
}

}  // namespace

}  // namespace velmorctltest
