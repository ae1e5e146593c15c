#include "nss/second_opinion.h"

#include <gtest/gtest.h>

#include "failure_of.h"

namespace velmorctltest {

namespace {

using velmorctl::ServiceMeaning;
using velmorctl::SwitchFile;
using velmorctl::WantedLine;

const WantedLine PASSWD = {1, "passwd", {{"files", {}}, {"winbind", {}}}};

bool Agrees(const std::string& before, const std::string& after, const WantedLine& wanted = PASSWD) {
  return velmorctl::ModelAgrees(SwitchFile(before), SwitchFile(after), wanted);
}

TEST(SecondOpinionTest, AgreesWithTheEdit) {
  EXPECT_TRUE(Agrees("passwd: files\n", "passwd: files winbind\n"));
}

TEST(SecondOpinionTest, AgreesWithANewLine) {
  EXPECT_TRUE(Agrees("group: files\n", "group: files\npasswd: files winbind\n"));
}

TEST(SecondOpinionTest, DisagreesWithAnotherService) {
  EXPECT_FALSE(Agrees("passwd: files\n", "passwd: files winbond\n"));
}

TEST(SecondOpinionTest, DisagreesWithAnotherOrder) {
  EXPECT_FALSE(Agrees("passwd: files\n", "passwd: winbind files\n"));
}

TEST(SecondOpinionTest, DisagreesWhenNothingWasDone) {
  EXPECT_FALSE(Agrees("passwd: files\n", "passwd: files\n"));
}

TEST(SecondOpinionTest, DisagreesWithAChangeOfAnotherDatabase) {
  EXPECT_FALSE(Agrees("passwd: files\ngroup: files\n", "passwd: files winbind\ngroup: sss\n"));
}

TEST(SecondOpinionTest, DisagreesWhenTheModelCannotReadTheNewText) {
  EXPECT_FALSE(Agrees("passwd: files\n", "passwd: files winbind \n"));
}

TEST(SecondOpinionTest, ReadsTheCriterionOfTheOnlyService) {
  const WantedLine wanted = {1, "passwd", {{"files", {"NOTFOUND=return"}}}};
  EXPECT_TRUE(Agrees("passwd: files [NOTFOUND=return] sss\n", "passwd: files [NOTFOUND=return]\n", wanted));
  EXPECT_TRUE(Agrees("passwd:\n", "passwd: files [NOTFOUND=return]\n", wanted));
  EXPECT_FALSE(Agrees("passwd:\n", "passwd: files [UNAVAIL=return]\n", wanted));
}

TEST(SecondOpinionTest, IsNotHeldWhereTheModelThrows) {
  EXPECT_TRUE(Agrees("passwd: files\r\n", "passwd: files winbind\r\n"));
}

TEST(SecondOpinionTest, IsNotHeldWhereOneOfSeveralServicesHasACriterion) {
  const WantedLine wanted = {1, "group", {{"files", {"SUCCESS=merge"}}, {"systemd", {}}, {"winbind", {}}}};
  EXPECT_TRUE(Agrees("group: files [SUCCESS=merge] systemd\n",
                     "group: files [SUCCESS=merge] systemd winbind\n", wanted));
}

TEST(SecondOpinionTest, IsNotHeldOnDatabasesThatTheModelDoesNotKnow) {
  EXPECT_TRUE(
      Agrees("sudoers: files\n", "sudoers: files sss\n", {1, "sudoers", {{"files", {}}, {"sss", {}}}}));
}

struct WrongEdit {
  const char* name;
  const char* before;
  const char* after;
};

class WrongEditTest : public ::testing::TestWithParam<WrongEdit> {};

TEST_P(WrongEditTest, IsRefused) {
  const velmorctl::Failure failure = FailureOf([] {
    velmorctl::ProveEdit(SwitchFile(GetParam().before), SwitchFile(GetParam().after), "nsswitch.conf",
                         PASSWD);
  });
  EXPECT_EQ(failure.Code(), velmorctl::ExitCode::Other);
}

INSTANTIATE_TEST_SUITE_P(
    Each, WrongEditTest,
    ::testing::Values(WrongEdit{"ThatChangesNothing", "passwd: files winbind\n", "passwd: files winbind\n"},
                      WrongEdit{"OfAnotherLine", "passwd: files winbind\n#\n", "passwd: files winbind\n# \n"},
                      WrongEdit{"OfTwoLines", "passwd: files\n#\n", "passwd: files winbind\n# \n"},
                      WrongEdit{"ThatRemovesALine", "#\npasswd: files\n", "passwd: files winbind\n"},
                      WrongEdit{"WithOtherServices", "passwd: files\n", "passwd: files winbind sss\n"},
                      WrongEdit{"ThatALaterLineUndoes", "passwd: files\npasswd: files\n",
                                "passwd: files winbind\npasswd: files\n"}),
    [](const auto& test) { return std::string(test.param.name); });

TEST(EditProofTest, TakesTheRightEdit) {
  EXPECT_NO_THROW(velmorctl::ProveEdit(SwitchFile("passwd: files\n#\n"),
                                       SwitchFile("passwd: files winbind\n#\n"), "nsswitch.conf", PASSWD));
}

}  // namespace

}  // namespace velmorctltest
