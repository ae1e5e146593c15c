#include "pam/policy_line.h"

#include <gtest/gtest.h>

namespace velmorctltest {

namespace {

using velmorctl::pam::Facility;
using velmorctl::pam::PolicyLine;
using velmorctl::pam::QuotedArgument;
using velmorctl::pam::ReadPolicyLine;
using Effect = PolicyLine::Effect;
using Words = std::vector<std::string>;

TEST(PolicyLineTest, HasFacilityControlModuleAndArguments) {
  PolicyLine line = ReadPolicyLine("auth\trequired  pam_unix.so nullok try_first_pass\n");
  EXPECT_EQ(line.facility, Facility::Auth);
  EXPECT_EQ(line.controlText, "required");
  EXPECT_EQ(line.target, "pam_unix.so");
  EXPECT_EQ(line.arguments, (Words{"nullok", "try_first_pass"}));
  EXPECT_EQ(line.effect, Effect::Works);
  EXPECT_TRUE(line.problem.empty());
}

TEST(PolicyLineTest, ADashMakesItQuiet) {
  PolicyLine line = ReadPolicyLine("-Session optional pam_systemd.so");
  EXPECT_TRUE(line.quiet);
  EXPECT_EQ(line.facility, Facility::Session);
}

TEST(PolicyLineTest, BracketsHoldWordsTogether) {
  PolicyLine line = ReadPolicyLine("auth [success=1 default=ignore] pam_x.so [a \\]b]c [");
  EXPECT_EQ(line.controlText, "success=1 default=ignore");
  EXPECT_EQ(line.Control(), "[success=1 default=ignore]");
  EXPECT_EQ(line.arguments, (Words{"a ]b", "c", ""}));
}

TEST(PolicyLineTest, TellsTheThreeWaysToInclude) {
  EXPECT_EQ(ReadPolicyLine("auth include common").kind, PolicyLine::Kind::Include);
  EXPECT_EQ(ReadPolicyLine("auth substack common").kind, PolicyLine::Kind::Substack);
  PolicyLine whole = ReadPolicyLine("@include common-auth");
  EXPECT_EQ(whole.kind, PolicyLine::Kind::IncludeWhole);
  EXPECT_EQ(whole.target, "common-auth");
}

struct BadLine {
  const char* name;
  const char* text;
  Effect effect;
  const char* value;
};

class BadLineTest : public ::testing::TestWithParam<BadLine> {};

TEST_P(BadLineTest, HasAProblem) {
  PolicyLine line = ReadPolicyLine(GetParam().text);
  EXPECT_EQ(line.effect, GetParam().effect);
  EXPECT_EQ(line.problemValue, GetParam().value);
  EXPECT_FALSE(line.problem.empty());
}

INSTANTIATE_TEST_SUITE_P(
    Each, BadLineTest,
    ::testing::Values(BadLine{"UnknownFacility", "authh required x.so", Effect::Fails, "authh"},
                      BadLine{"FacilityAlone", "auth", Effect::Fails, "auth"},
                      BadLine{"NoModule", "auth required", Effect::Fails, "required"},
                      BadLine{"UnknownControl", "auth requird x.so", Effect::AlwaysBad, "requird"},
                      BadLine{"UnclosedControl", "auth [success=ok x.so", Effect::Fails, "success=ok x.so"},
                      BadLine{"EmptyModule", "auth required []", Effect::WholeFails, ""},
                      BadLine{"ModuleOfASuffix", "auth required a/.so", Effect::WholeFails, "a/.so"},
                      BadLine{"IncludeOfNothing", "auth include", Effect::Crashes, "include"},
                      BadLine{"WholeIncludeOfNothing", "@include", Effect::Crashes, ""},
                      BadLine{"FirstProblemCounts", "authh required []", Effect::WholeFails, "authh"}),
    [](const ::testing::TestParamInfo<BadLine>& bad) { return bad.param.name; });

TEST(PolicyLineTest, QuotesArgumentsThatNeedIt) {
  EXPECT_EQ(QuotedArgument("plain=1"), "plain=1");
  EXPECT_EQ(QuotedArgument(""), "[]");
  EXPECT_EQ(QuotedArgument("a ]b"), "[a \\]b]");
  EXPECT_EQ(QuotedArgument("[x"), "[[x]");
}

TEST(PolicyLineTest, ReadsWhatItQuotes) {
  for (const std::string argument : {"plain", "", "a b", "]", "[", "[a]", "a\tb] c"}) {
    EXPECT_EQ(ReadPolicyLine("auth required x.so " + QuotedArgument(argument)).arguments, Words{argument});
  }
}

}  // namespace

}  // namespace velmorctltest
