// Lines that are put into policy files and taken out again, byte for byte.
#include "pam_edit/own_line.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace velmorctl::pam {

namespace {

using Side = OwnLine::Side;

const std::string MARK = "# Added by \"velmorctl pam enable\": pam_x.so\n";

OwnLine Auth(Side side, const std::string& control = "sufficient") {
  return {Facility::Auth, side, control, "pam_x.so"};
}

TEST(OwnLineTest, StandsBehindItsAnchorWithItsMark) {
  EXPECT_EQ(WithOwnLine("auth required pam_a.so\nauth required pam_b.so\n", 1, Auth(Side::After)),
            "auth required pam_a.so\n" + MARK + "auth\tsufficient\tpam_x.so\nauth required pam_b.so\n");
}

TEST(OwnLineTest, StandsBeforeItsAnchorBelowTheAnchorsComment) {
  EXPECT_EQ(WithOwnLine("# a\nauth required pam_a.so\n", 2, Auth(Side::Before)),
            "# a\n" + MARK + "auth\tsufficient\tpam_x.so\nauth required pam_a.so\n");
}

TEST(OwnLineTest, AJumpThatLeadsPastItBecomesLonger) {
  EXPECT_EQ(WithOwnLine("auth [success=1 default=ignore] pam_a.so\nauth requisite pam_deny.so\n", 1,
                        Auth(Side::After)),
            "auth [success=2 default=ignore] pam_a.so\n" + MARK +
                "auth\tsufficient\tpam_x.so\nauth requisite pam_deny.so\n");
}

TEST(OwnLineTest, AJumpThatEndsBeforeItStays) {
  const std::string text =
      "auth [success=1 default=ignore] pam_a.so\nauth required pam_b.so\nauth required pam_c.so\n";
  EXPECT_TRUE(
      WithOwnLine(text, 3, Auth(Side::After)).starts_with("auth [success=1 default=ignore] pam_a.so\n"));
}

TEST(OwnLineTest, AJumpToItsPlaceLeadsToIt) {
  const std::string text = "auth [default=1 success=ok] pam_localuser.so\nauth sufficient pam_unix.so\n";
  EXPECT_EQ(WithOwnLine(text, 2, Auth(Side::After)), text + MARK + "auth\tsufficient\tpam_x.so\n");
}

TEST(OwnLineTest, JumpsOfOneControlAreToldApart) {
  const std::string text =
      "auth [success=3 ignore=1 new_authtok_reqd = 2] pam_a.so\n"
      "auth required pam_b.so\nauth required pam_c.so\nauth required pam_d.so\n";
  EXPECT_TRUE(WithOwnLine(text, 2, Auth(Side::After))
                  .starts_with("auth [success=4 ignore=1 new_authtok_reqd = 3] pam_a.so\n"));
}

TEST(OwnLineTest, JumpsOfOtherFacilitiesStay) {
  const std::string text =
      "account [success=1 default=ignore] pam_a.so\nauth required pam_b.so\naccount required pam_c.so\n"
      "account required pam_d.so\n";
  EXPECT_TRUE(
      WithOwnLine(text, 2, Auth(Side::After)).starts_with("account [success=1 default=ignore] pam_a.so\n"));
}

TEST(OwnLineTest, NumbersInParametersAndCommentsAreNoJumps) {
  const std::string text = "auth required pam_a.so x=1 [y=1] # [success=1]\nauth required pam_b.so\n";
  EXPECT_TRUE(WithOwnLine(text, 1, Auth(Side::After))
                  .starts_with("auth required pam_a.so x=1 [y=1] # [success=1]\n"));
}

TEST(OwnLineTest, AJumpOnAContinuedLineIsFound) {
  const std::string text =
      "auth [success=1 \\\n  default=ignore] \\\n  pam_a.so\nauth requisite pam_deny.so\n";
  const std::string with = WithOwnLine(text, 1, Auth(Side::After));
  EXPECT_EQ(with, "auth [success=2 \\\n  default=ignore] \\\n  pam_a.so\n" + MARK +
                      "auth\tsufficient\tpam_x.so\nauth requisite pam_deny.so\n");
  EXPECT_EQ(WithoutOwnLines(with), text);
}

TEST(OwnLineTest, TakingOutGivesBackTheBytes) {
  const std::string texts[] = {
      "auth sufficient pam_unix.so\nauth required pam_deny.so\n",
      "auth\t[success=9 default=ignore]  pam_unix.so  # local\n\n\nauth required pam_deny.so",
      "auth sufficient pam_unix.so",
      "-auth sufficient pam_unix.so\n@include other\n",
  };
  for (const std::string& text : texts) {
    for (const Side side : {Side::Before, Side::After}) {
      const std::string with = WithOwnLine(text, 1, Auth(side));
      EXPECT_NE(with, text);
      EXPECT_EQ(WithoutOwnLines(with), text);
    }
  }
}

TEST(OwnLineTest, TakingOutSeveralGivesBackTheBytes) {
  const std::string text =
      "auth [success=2 default=ignore] pam_a.so\nauth required pam_unix.so\n"
      "auth required pam_b.so\naccount required pam_unix.so\n";
  std::string with = WithOwnLine(text, 4, {Facility::Account, Side::Before, "required", "pam_x.so a [b c]"});
  with = WithOwnLine(with, 2, {Facility::Auth, Side::After, "required", "pam_permit.so"});
  with = WithOwnLine(with, 2, Auth(Side::Before, "[success=1 default=ignore]"));
  EXPECT_EQ(ModulesOfOwnLines(with), (std::vector<std::string>{"pam_x.so", "pam_permit.so", "pam_x.so"}));
  EXPECT_EQ(WithoutOwnLines(with), text);
}

TEST(OwnLineTest, ALineThatTheAdministratorHasChangedStays) {
  const std::string text = MARK + "auth\tsufficient\tpam_x.so debug\n";
  EXPECT_EQ(WithoutOwnLines(text), text);
  EXPECT_TRUE(ModulesOfOwnLines(text).empty());
}

TEST(OwnLineTest, ALineWithoutTheMarkStays) {
  const std::string text = "auth\tsufficient\tpam_x.so\n";
  EXPECT_EQ(WithoutOwnLines(text), text);
}

TEST(OwnLineTest, AMarkAloneStays) {
  EXPECT_EQ(WithoutOwnLines(MARK), MARK);
  EXPECT_EQ(WithoutOwnLines(MARK + "\n"), MARK + "\n");
}

TEST(OwnLineTest, AnAnchorThatIsNoPolicyLineIsRefused) {
  EXPECT_THROW(WithOwnLine("# only\n", 1, Auth(Side::After)), std::invalid_argument);
}

}  // namespace

}  // namespace velmorctl::pam
