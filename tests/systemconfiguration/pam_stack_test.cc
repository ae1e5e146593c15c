#include <gtest/gtest.h>

#include <sstream>
#include <string>

#include "support/expect_throw_what.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::Written;

PAMStack AuthStack() {
  PAMStack stack(PAMFacility::Auth);
  stack.push_back(PAMEntry(PAMControl::Required, "pam_env.so"));
  stack.push_back(PAMEntry(PAMControl::Sufficient, "pam_unix.so"));
  stack.push_back(PAMEntry(PAMControl::Optional, "pam_unix.so"));
  return stack;
}

TEST(PAMStackTest, HasNoFacilityAndNoEntriesWhenDefaultConstructed) {
  const PAMStack stack;
  EXPECT_TRUE(stack.Facility() == PAMFacility::Unset);
  EXPECT_TRUE(stack.empty());
}

TEST(PAMStackTest, KnowsItsFacility) {
  EXPECT_TRUE(AuthStack().Facility() == PAMFacility::Auth);
}

TEST(PAMStackTest, IsAQueueOfEntries) {
  PAMStack stack = AuthStack();
  stack.push_front(PAMEntry(PAMControl::Requisite, "pam_nologin.so"));
  stack.erase(stack.begin() + 1);
  EXPECT_EQ(stack.size(), 3U);
  EXPECT_EQ(stack.front().module(), "pam_nologin.so");
  EXPECT_EQ(stack[1].module(), "pam_unix.so");
}

TEST(PAMStackTest, ACopyHasFacilityAndEntriesOfItsOwn) {
  const PAMStack stack = AuthStack();
  PAMStack copy = stack;
  copy.clear();
  EXPECT_TRUE(copy.Facility() == PAMFacility::Auth);
  EXPECT_EQ(stack.size(), 3U);
}

TEST(PAMStackTest, AssignmentTakesTheFacilityToo) {
  PAMStack stack(PAMFacility::Session);
  stack = AuthStack();
  EXPECT_TRUE(stack.Facility() == PAMFacility::Auth);
}

TEST(PAMStackTest, FindsTheFirstOfTwoEntriesWithTheSameModule) {
  PAMStack stack = AuthStack();
  EXPECT_EQ(stack.find("pam_unix.so"), stack.begin() + 1);
}

TEST(PAMStackTest, FindsInAConstantStack) {
  const PAMStack stack = AuthStack();
  EXPECT_EQ(stack.find("pam_unix.so"), stack.begin() + 1);
}

TEST(PAMStackTest, FindsTheEndWhenNoModuleIsEqual) {
  PAMStack stack = AuthStack();
  EXPECT_EQ(stack.find("pam_unix"), stack.end());
  EXPECT_EQ(stack.find("PAM_UNIX.SO"), stack.end());
}

TEST(PAMStackTest, WritesALineForEachEntryInOrder) {
  EXPECT_EQ(Written(AuthStack()),
            "auth\trequired\tpam_env.so\t\n"
            "auth\tsufficient\tpam_unix.so\t\n"
            "auth\toptional\tpam_unix.so\t\n");
}

TEST(PAMStackTest, WritesNothingWhenEmpty) {
  EXPECT_EQ(Written(PAMStack(PAMFacility::Auth)), "");
}

TEST(PAMStackTest, AnEmptyStackWithoutFacilityIsWrittenWithoutComplaint) {
  EXPECT_EQ(Written(PAMStack()), "");
}

TEST(PAMStackTest, AnEntryInAStackWithoutFacilityCannotBeWritten) {
  PAMStack stack;
  stack.push_back(PAMEntry(PAMControl::Required, "m"));
  EXPECT_THROW_WHAT(Written(stack), InvalidFacilityException, "Invalid Facility: ");
}

TEST(PAMStackTest, AnEntryWithoutControlIsMetBehindItsFacility) {
  PAMStack stack = AuthStack();
  stack.resize(2);
  stack[1] = PAMEntry();
  std::ostringstream stream;
  EXPECT_THROW_WHAT(stream << stack, InvalidControlException, "Invalid Control: ");
  EXPECT_EQ(stream.str(), "auth\trequired\tpam_env.so\t\nauth\t");
}

}  // namespace
}  // namespace SystemConfiguration
