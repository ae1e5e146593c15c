#include "pam/control.h"

#include <gtest/gtest.h>

namespace velmorctltest {

namespace {

using velmorctl::pam::Action;
using velmorctl::pam::ActionFor;
using velmorctl::pam::Control;
using velmorctl::pam::NameOf;
using velmorctl::pam::ReadControl;
using velmorctl::pam::ReturnCode;

/// The actions for success, new_authtok_reqd, ignore, auth_err and a number without a name.
std::string Actions(const std::string& text) {
  const Control control = ReadControl(text);
  std::string actions;
  for (ReturnCode code : {ReturnCode::Success, ReturnCode::NewTokenRequired, ReturnCode::Ignore,
                          ReturnCode::AuthenticationError, static_cast<ReturnCode>(99)}) {
    actions += NameOf(ActionFor(control.actions, code)) + " ";
  }
  return actions;
}

TEST(ControlTest, KeywordsStandForActions) {
  EXPECT_EQ(Actions("required"), "ok ok ignore bad bad ");
  EXPECT_EQ(Actions("Requisite"), "ok ok ignore die bad ");
  EXPECT_EQ(Actions("sufficient"), "done done ignore ignore bad ");
  EXPECT_EQ(Actions("OPTIONAL"), "ok ok ignore ignore bad ");
}

TEST(ControlTest, AListNamesActionsAndTheRestIsBad) {
  EXPECT_EQ(Actions("success=done ignore=reset auth_err=12"), "done bad reset 12 bad ");
}

TEST(ControlTest, DefaultIsForWhatHasNoActionSoFar) {
  EXPECT_EQ(Actions("success=ok default=die auth_err=ignore default=ok"), "ok die die ignore bad ");
}

TEST(ControlTest, IncludesAreToldFromModules) {
  EXPECT_EQ(ReadControl("include").kind, Control::Kind::Include);
  EXPECT_EQ(ReadControl("Substack").kind, Control::Kind::Substack);
}

class BadControlTest : public ::testing::TestWithParam<const char*> {};

TEST_P(BadControlTest, MakesEveryAnswerBadAndSaysWhy) {
  EXPECT_EQ(Actions(GetParam()), "bad bad bad bad bad ");
  EXPECT_EQ(ReadControl(GetParam()).kind, Control::Kind::Invalid);
  EXPECT_FALSE(ReadControl(GetParam()).problem.empty());
}

INSTANTIATE_TEST_SUITE_P(Each, BadControlTest,
                         ::testing::Values("nonsense", "success", "success=", "success=what", "success=0",
                                           "success=-1", "success=99999999999", "SUCCESS=ok", "success=OK",
                                           "success=ok what=ok", "success ok"));

TEST(ControlTest, AnEmptyListIsGoodAndMakesEveryAnswerBad) {
  EXPECT_EQ(ReadControl("").kind, Control::Kind::Bracketed);
  EXPECT_EQ(Actions(""), "bad bad bad bad bad ");
}

}  // namespace

}  // namespace velmorctltest
