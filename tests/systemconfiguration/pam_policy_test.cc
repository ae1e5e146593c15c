#include <gtest/gtest.h>

#include <list>
#include <sstream>
#include <string>

#include "support/expect_throw_what.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::ReadPolicy;
using testsupport::Written;

const std::string emptyPolicy = "#%PAM-1.0\n\n";

TEST(PAMPolicyTest, KeepsItsNameApartFromItsText) {
  PAMPolicy policy("sshd");
  std::istringstream stream("auth required m\n");
  stream >> policy;
  EXPECT_EQ(policy.name(), "sshd");
  EXPECT_EQ(Written(policy).find("sshd"), std::string::npos);
}

TEST(PAMPolicyTest, AnEmptyInputIsWrittenAsTheHeaderAlone) {
  EXPECT_EQ(Written(ReadPolicy("")), emptyPolicy);
}

TEST(PAMPolicyTest, CommentsAndBlankLinesAloneAreWrittenAsTheHeaderAlone) {
  EXPECT_EQ(Written(ReadPolicy("#%PAM-1.0\n\n  \t\n # indented\n#auth required m\n\v\f\r\n")), emptyPolicy);
}

TEST(PAMPolicyTest, TheHeaderIsNotRequired) {
  EXPECT_EQ(Written(ReadPolicy("account required m\n")), "#%PAM-1.0\n\naccount\trequired\tm\t\n\n");
}

TEST(PAMPolicyTest, ABracketedControlOnTwoLinesBecomesOneEntry) {
  PAMPolicy policy = ReadPolicy("auth [success=ok\ndefault=die] pam_x.so a b\n");
  ASSERT_EQ(policy[PAMFacility::Auth].size(), 1U);
  EXPECT_EQ(Written(policy[PAMFacility::Auth]), "auth\t[success=ok default=die]\tpam_x.so\ta b \n");
}

TEST(PAMPolicyTest, ALineWithoutParametersIsWrittenWithATrailingTab) {
  PAMPolicy policy = ReadPolicy("account required pam_unix.so\n");
  EXPECT_EQ(Written(policy[PAMFacility::Account]), "account\trequired\tpam_unix.so\t\n");
}

TEST(PAMPolicyTest, StacksAreWrittenByTheNumbersOfTheirFacilities) {
  EXPECT_EQ(
      Written(ReadPolicy("session required s\npassword required p\nauth required a\naccount required c\n")),
      "#%PAM-1.0\n\n"
      "account\trequired\tc\t\n\n"
      "auth\trequired\ta\t\n\n"
      "password\trequired\tp\t\n\n"
      "session\trequired\ts\t\n\n");
}

TEST(PAMPolicyTest, AbsentFacilitiesLeaveNoBlankLine) {
  EXPECT_EQ(Written(ReadPolicy("session required s\nauth required a\naccount required c\n")),
            "#%PAM-1.0\n\naccount\trequired\tc\t\n\nauth\trequired\ta\t\n\nsession\trequired\ts\t\n\n");
}

TEST(PAMPolicyTest, LinesOfAFacilityKeepTheirOrder) {
  PAMPolicy policy = ReadPolicy("auth required 1\nsession required 2\nauth required 3\nauth required 4\n");
  EXPECT_EQ(Written(policy[PAMFacility::Auth]),
            "auth\trequired\t1\t\nauth\trequired\t3\t\nauth\trequired\t4\t\n");
}

TEST(PAMPolicyTest, AMinusBeforeAFacilityIsRefused) {
  EXPECT_THROW_WHAT(ReadPolicy("-session optional pam_systemd.so\n"), InvalidFacilityException,
                    "Invalid Facility: -session");
}

TEST(PAMPolicyTest, AnIncludeDirectiveIsRefused) {
  EXPECT_THROW_WHAT(ReadPolicy("@include common-auth\n"), InvalidFacilityException,
                    "Invalid Facility: @include");
}

TEST(PAMPolicyTest, AControlInTheWrongCaseIsRefused) {
  EXPECT_THROW_WHAT(ReadPolicy("auth Required pam_x.so\n"), InvalidControlException,
                    "Invalid Control: Required");
}

TEST(PAMPolicyTest, AFacilityAloneAtTheEndIsRefused) {
  EXPECT_THROW_WHAT(ReadPolicy("auth"), InvalidControlException, "Invalid Control: ");
}

TEST(PAMPolicyTest, ABracketThatIsNeverClosedIsRefused) {
  EXPECT_THROW_WHAT(ReadPolicy("auth [success=ok\n  m\n"), InvalidControlException,
                    "Invalid Control: [success=ok m");
}

TEST(PAMPolicyTest, AModuleIsTakenFromTheNextLine) {
  PAMPolicy policy = ReadPolicy("auth required\npam_y.so arg\n");
  ASSERT_EQ(policy[PAMFacility::Auth].size(), 1U);
  EXPECT_EQ(policy[PAMFacility::Auth].front().module(), "pam_y.so");
  EXPECT_EQ(policy[PAMFacility::Auth].front().parameters(), std::list<std::string>{"arg"});
}

TEST(PAMPolicyTest, AnEntryWithoutModuleAtTheEndIsKept) {
  PAMPolicy policy = ReadPolicy("auth required");
  ASSERT_EQ(policy[PAMFacility::Auth].size(), 1U);
  EXPECT_EQ(policy[PAMFacility::Auth].front().module(), "");
}

TEST(PAMPolicyTest, ANumberSignBehindAFacilityIsNoComment) {
  PAMPolicy policy = ReadPolicy("auth required m # why\n");
  EXPECT_EQ(policy[PAMFacility::Auth].front().parameters(), (std::list<std::string>{"#", "why"}));
}

TEST(PAMPolicyTest, EntriesBeforeAFaultStay) {
  std::istringstream stream("auth required a\naccount required b\nfoo required c\nsession required d\n");
  PAMPolicy policy("test");
  EXPECT_THROW(stream >> policy, InvalidFacilityException);
  EXPECT_EQ(Written(policy), "#%PAM-1.0\n\naccount\trequired\tb\t\n\nauth\trequired\ta\t\n\n");
}

TEST(PAMPolicyTest, AnUnknownFacilityLeavesTheStreamJustBehindIt) {
  std::istringstream stream("auth required a\nfoo required c\n");
  PAMPolicy policy("test");
  EXPECT_THROW(stream >> policy, InvalidFacilityException);
  EXPECT_TRUE(stream.good());
  EXPECT_EQ(stream.tellg(), 19);
}

TEST(PAMPolicyTest, AnEntryWithoutControlMakesNoStack) {
  std::istringstream stream("auth wrong a\n");
  PAMPolicy policy("test");
  EXPECT_THROW(stream >> policy, InvalidControlException);
  EXPECT_EQ(Written(policy), emptyPolicy);
}

TEST(PAMPolicyTest, ReadingAppendsToTheStacksThatExist) {
  PAMPolicy policy = ReadPolicy("auth required a\n");
  std::istringstream stream("auth optional b\n");
  stream >> policy;
  EXPECT_EQ(Written(policy[PAMFacility::Auth]), "auth\trequired\ta\t\nauth\toptional\tb\t\n");
}

TEST(PAMPolicyTest, IndexingMakesAnEmptyStackThatIsWrittenAsABlankLine) {
  PAMPolicy policy("test");
  EXPECT_TRUE(policy[PAMFacility::Password].empty());
  EXPECT_TRUE(policy[PAMFacility::Password].Facility() == PAMFacility::Password);
  EXPECT_EQ(Written(policy), "#%PAM-1.0\n\n\n");
}

TEST(PAMPolicyTest, IndexingGivesTheSameStackEachTime) {
  PAMPolicy policy("test");
  PAMStack& stack = policy[PAMFacility::Auth];
  policy[PAMFacility::Account];
  EXPECT_EQ(&policy[PAMFacility::Auth], &stack);
}

TEST(PAMPolicyTest, AnEmptyStackWithoutFacilityIsWrittenAsABlankLineToo) {
  PAMPolicy policy("test");
  policy[PAMFacility()];
  EXPECT_EQ(Written(policy), "#%PAM-1.0\n\n\n");
}

TEST(PAMPolicyTest, ACopyIsIndependent) {
  PAMPolicy policy = ReadPolicy("auth required a\n");
  PAMPolicy copy = policy;
  copy[PAMFacility::Auth].clear();
  EXPECT_EQ(policy[PAMFacility::Auth].size(), 1U);
}

TEST(PAMPolicyTest, AssignmentReplacesNameAndStacks) {
  PAMPolicy policy("old");
  policy[PAMFacility::Session];
  policy = ReadPolicy("auth required a\n");
  EXPECT_EQ(policy.name(), "test");
  EXPECT_EQ(Written(policy), "#%PAM-1.0\n\nauth\trequired\ta\t\n\n");
}

}  // namespace
}  // namespace SystemConfiguration
