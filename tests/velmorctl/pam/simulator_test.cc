#include "pam/simulator.h"

#include <gtest/gtest.h>

#include <map>

#include "pam/control.h"
#include "pam/policy_line.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::Action;
using velmorctl::pam::FrozenChain;
using velmorctl::pam::Operation;
using velmorctl::pam::ReadControl;
using velmorctl::pam::ReturnCode;
using velmorctl::pam::Simulate;
using velmorctl::pam::Stack;
using velmorctl::pam::StackEntry;
using velmorctl::pam::Verdict;
using Code = ReturnCode;

StackEntry Entry(const std::string& control, std::size_t level = 0) {
  StackEntry entry;
  entry.level = level;
  entry.control = control;
  entry.actions = ReadControl(control).actions;
  return entry;
}

Verdict RunStack(const Stack& stack, const std::vector<Code>& answers) {
  FrozenChain chain;
  return Simulate(
      stack, Operation::Authenticate,
      [&answers](const StackEntry&, std::size_t index, Operation) { return answers[index]; }, chain);
}

struct Decision {
  const char* name;
  std::vector<std::pair<const char*, Code>> entries;
  Code verdict;
};

class DecisionTest : public ::testing::TestWithParam<Decision> {};

TEST_P(DecisionTest, IsThatOfLibpam) {
  Stack stack;
  std::vector<Code> answers;
  for (const auto& [control, answer] : GetParam().entries) {
    stack.push_back(Entry(control));
    answers.push_back(answer);
  }
  EXPECT_EQ(RunStack(stack, answers).code, GetParam().verdict);
}

INSTANTIATE_TEST_SUITE_P(
    Each, DecisionTest,
    ::testing::Values(
        Decision{"EmptyStack", {}, Code::PermissionDenied},
        Decision{"Required", {{"required", Code::Success}}, Code::Success},
        Decision{"FirstFailureCounts",
                 {{"required", Code::AuthenticationError}, {"required", Code::UserUnknown}},
                 Code::AuthenticationError},
        Decision{"RequisiteEnds",
                 {{"requisite", Code::UserUnknown}, {"required", Code::AuthenticationError}},
                 Code::UserUnknown},
        Decision{"SufficientEnds",
                 {{"sufficient", Code::Success}, {"required", Code::AuthenticationError}},
                 Code::Success},
        Decision{"SufficientFailureIsIgnored",
                 {{"sufficient", Code::AuthenticationError}, {"required", Code::Success}},
                 Code::Success},
        Decision{"SufficientBehindAFailure",
                 {{"required", Code::AuthenticationError}, {"sufficient", Code::Success}},
                 Code::AuthenticationError},
        Decision{"OptionalAlone", {{"optional", Code::Success}}, Code::Success},
        Decision{"OptionalFailureAlone", {{"optional", Code::AuthenticationError}}, Code::PermissionDenied},
        Decision{"AllIgnored", {{"required", Code::Ignore}}, Code::PermissionDenied},
        Decision{"OkKeepsAFailure", {{"default=ok", Code::AuthenticationError}}, Code::AuthenticationError},
        Decision{"OkBehindOkOfAFailure",
                 {{"default=ok", Code::NewTokenRequired}, {"required", Code::Success}},
                 Code::NewTokenRequired},
        Decision{"BadSuccess", {{"success=bad", Code::Success}}, Code::PermissionDenied},
        Decision{"ResetForgets",
                 {{"required", Code::AuthenticationError},
                  {"success=reset", Code::Success},
                  {"required", Code::Success}},
                 Code::Success},
        Decision{"JumpPassesOver",
                 {{"success=1 default=ignore", Code::Success},
                  {"requisite", Code::AuthenticationError},
                  {"required", Code::Success}},
                 Code::Success},
        Decision{"JumpOnlyIsNoYes",
                 {{"success=1", Code::Success}, {"required", Code::Success}},
                 Code::PermissionDenied},
        Decision{"JumpOutOfTheStack",
                 {{"required", Code::Success}, {"success=1", Code::Success}},
                 Code::PermissionDenied},
        Decision{"NumberWithoutName", {{"default=ok", static_cast<Code>(77)}}, Code::PermissionDenied},
        Decision{
            "Incomplete", {{"required", Code::Incomplete}, {"required", Code::Success}}, Code::Incomplete}),
    [](const ::testing::TestParamInfo<Decision>& decision) { return decision.param.name; });

/// A substack of two entries between two others.
Stack WithSubstack(const std::string& first, const std::string& second) {
  StackEntry substack = Entry("substack");
  substack.kind = StackEntry::Kind::Substack;
  return {substack, Entry(first, 1), Entry(second, 1), Entry("required")};
}

TEST(SimulatorTest, DoneEndsOnlyTheSubstack) {
  const Verdict verdict =
      RunStack(WithSubstack("sufficient", "required"),
               {Code::Success, Code::Success, Code::AuthenticationError, Code::UserUnknown});
  EXPECT_EQ(verdict.code, Code::UserUnknown);
  EXPECT_EQ(verdict.trace.size(), 3U);
}

TEST(SimulatorTest, DieInASubstackLetsTheStackGoOnAndRefuses) {
  const Verdict verdict = RunStack(WithSubstack("requisite", "required"),
                                   {Code::Success, Code::AuthenticationError, Code::Success, Code::Success});
  EXPECT_EQ(verdict.code, Code::AuthenticationError);
  EXPECT_EQ(verdict.trace.size(), 3U);
}

TEST(SimulatorTest, AJumpStaysInItsSubstack) {
  const Verdict verdict = RunStack(WithSubstack("success=2", "required"),
                                   {Code::Success, Code::Success, Code::Success, Code::Success});
  EXPECT_EQ(verdict.code, Code::PermissionDenied);
  EXPECT_TRUE(verdict.trace[1].badJump);
}

TEST(SimulatorTest, AJumpPassesOverASubstackAsOne) {
  Stack stack = WithSubstack("required", "required");
  stack.insert(stack.begin(), Entry("success=1"));
  const Verdict verdict = RunStack(stack, {Code::Success, Code::Success, Code::AuthenticationError,
                                           Code::AuthenticationError, Code::Success});
  EXPECT_EQ(verdict.code, Code::Success);
  EXPECT_EQ(verdict.trace.size(), 2U);
}

TEST(SimulatorTest, ResetGoesBackToBeforeTheSubstack) {
  const Verdict verdict = RunStack(WithSubstack("required", "success=reset"),
                                   {Code::Success, Code::AuthenticationError, Code::Success, Code::Success});
  EXPECT_EQ(verdict.code, Code::Success);
}

TEST(SimulatorTest, AnEntryThatAlwaysFailsAsksNobody) {
  StackEntry entry = Entry("required");
  entry.kind = StackEntry::Kind::AlwaysFails;
  FrozenChain chain;
  const Verdict verdict = Simulate(
      {entry}, Operation::Authenticate,
      [](const StackEntry&, std::size_t, Operation) -> Code { throw std::logic_error("asked"); }, chain);
  EXPECT_EQ(verdict.code, Code::PermissionDenied);
}

TEST(SimulatorTest, CredentialsGoTheWayOfTheAuthentication) {
  const Stack stack = {Entry("success=1 default=ignore"), Entry("requisite"), Entry("required")};
  FrozenChain chain;
  Simulate(
      stack, Operation::Authenticate, [](const StackEntry&, std::size_t, Operation) { return Code::Success; },
      chain);
  const Verdict verdict = Simulate(
      stack, Operation::SetCredentials,
      [](const StackEntry&, std::size_t index, Operation) {
        return index == 0 ? Code::CredentialsError : Code::Success;
      },
      chain);
  EXPECT_EQ(verdict.code, Code::Success);
  ASSERT_EQ(verdict.trace.size(), 2U);
  EXPECT_TRUE(verdict.trace[0].frozen);
  EXPECT_EQ(verdict.trace[1].entry, 2U);
}

TEST(SimulatorTest, TheTraceTellsWhatDecided) {
  const Verdict verdict = RunStack({Entry("optional"), Entry("required"), Entry("required")},
                                   {Code::AuthenticationError, Code::UserUnknown, Code::Success});
  ASSERT_EQ(verdict.trace.size(), 3U);
  EXPECT_FALSE(verdict.trace[0].decided);
  EXPECT_TRUE(verdict.trace[1].decided);
  EXPECT_FALSE(verdict.trace[2].decided);
  EXPECT_EQ(verdict.trace[1].action, (Action{Action::Kind::Bad, 0}));
}

}  // namespace

}  // namespace velmorctltest
