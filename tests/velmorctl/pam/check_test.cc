#include "pam/check.h"

#include <gtest/gtest.h>

#include "pam/module_answer.h"
#include "pam/resolver.h"
#include "policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::CheckedSystem;
using velmorctl::pam::CheckService;
using velmorctl::pam::CommonDirectoryModules;
using velmorctl::pam::Finding;
using velmorctl::pam::IsLoginService;
using velmorctl::pam::ResolvePolicy;

std::vector<Finding> Check(const PolicySet& files, const std::string& service = "svc") {
  const CheckedSystem system = {ReaderOf(files),
                                [](const std::string& module) { return module != "pam_nowhere.so"; },
                                [](const std::string&) { return false; }, CommonDirectoryModules()};
  return CheckService(service, system);
}

bool IsLogin(const PolicySet& files, const std::string& service = "svc") {
  return IsLoginService(ResolvePolicy(service, ReaderOf(files)), CommonDirectoryModules());
}

/// The reasons, a line each.
std::string Reasons(const std::vector<Finding>& findings) {
  std::string reasons;
  for (const Finding& finding : findings) {
    EXPECT_FALSE(finding.remedy.empty());
    reasons += finding.reason + "\n";
  }
  return reasons;
}

const std::string ACCOUNT = "account required pam_unix.so\n";
const std::string SESSION = "session required pam_unix.so\n";

TEST(CheckTest, AGoodServiceHasNoFinding) {
  EXPECT_EQ(Reasons(Check({{"svc",
                            "auth [success=2 default=ignore] pam_unix.so\n"
                            "auth [success=1 default=ignore] pam_winbind.so\n"
                            "auth requisite pam_deny.so\nauth required pam_permit.so\n" +
                                ACCOUNT + SESSION}})),
            "");
}

TEST(CheckTest, ADirectoryThatMustAnswerLocksEverybodyOut) {
  const std::string reasons = Reasons(Check(
      {{"svc",
        "auth [user_unknown=ignore success=ok default=die] pam_winbind.so\nauth required pam_unix.so\n" +
            ACCOUNT + SESSION}}));
  EXPECT_NE(reasons.find("while the directory is away, a local user with the right password cannot log in: "
                         "pam_authenticate answers authinfo_unavail: pam_winbind (/etc/pam.d/svc:1)"),
            std::string::npos)
      << reasons;
  EXPECT_NE(reasons.find("while the directory is away, root cannot log in"), std::string::npos) << reasons;
}

TEST(CheckTest, AnAccountStackThatNeedsTheDirectoryLocksEverybodyOut) {
  const std::string reasons = Reasons(
      Check({{"svc", "auth required pam_unix.so\n" + ACCOUNT +
                         "account [success=ok user_unknown=ignore default=bad] pam_sss.so\n" + SESSION}}));
  EXPECT_NE(reasons.find("pam_acct_mgmt answers authinfo_unavail"), std::string::npos) << reasons;
}

TEST(CheckTest, AServiceThatLetsNoLocalUserInIsFound) {
  EXPECT_NE(Reasons(Check({{"svc", "auth required pam_winbind.so\n" + ACCOUNT + SESSION}}))
                .find("no local user can log in"),
            std::string::npos);
}

TEST(CheckTest, AServiceWithoutAStackForSessionsNeedsNone) {
  EXPECT_EQ(Reasons(Check({{"svc", "auth required pam_unix.so\n" + ACCOUNT},
                           {"other", "session required pam_deny.so\n"}})),
            "");
}

TEST(CheckTest, AServiceWithoutAStackForSessionsMayLetEverybodyIn) {
  const std::string reasons = Reasons(Check(
      {{"svc", "auth required pam_permit.so\n" + ACCOUNT}, {"other", "session required pam_deny.so\n"}}));
  EXPECT_NE(reasons.find("a wrong password, or none, lets everybody in"), std::string::npos) << reasons;
}

TEST(CheckTest, AServiceThatRefusesEverySessionLetsNoLocalUserIn) {
  const std::string reasons =
      Reasons(Check({{"svc", "auth required pam_unix.so\n" + ACCOUNT + "session required pam_deny.so\n"}}));
  EXPECT_NE(reasons.find("no local user can log in"), std::string::npos) << reasons;
}

TEST(CheckTest, AServiceThatKeepsRootOutIsNoFault) {
  EXPECT_EQ(
      Reasons(Check({{"svc", "auth required pam_succeed_if.so user != root\nauth required pam_unix.so\n" +
                                 ACCOUNT + SESSION}})),
      "");
}

TEST(CheckTest, AStackThatNobodyEndsLetsEverybodyIn) {
  const std::string reasons = Reasons(
      Check({{"svc", "auth sufficient pam_unix.so\nauth required pam_permit.so\n" + ACCOUNT + SESSION}}));
  EXPECT_EQ(reasons,
            "a wrong password, or none, lets everybody in: pam_authenticate answers success: pam_permit "
            "(/etc/pam.d/svc:2) answered success, after pam_unix auth_err\n");
}

TEST(CheckTest, OtherMustNotLetEverybodyInEither) {
  EXPECT_NE(Reasons(Check({{"other",
                            "auth required pam_permit.so\naccount required pam_permit.so\n"
                            "session required pam_permit.so\n"}},
                          "other"))
                .find("lets everybody in"),
            std::string::npos);
}

TEST(CheckTest, AMissingModuleIsFoundOnItsLine) {
  const std::vector<Finding> findings =
      Check({{"svc", "auth required pam_unix.so\n\nsession optional pam_nowhere.so\n"}});
  ASSERT_EQ(findings.size(), 1U);
  EXPECT_EQ(findings[0].origin.file, "/etc/pam.d/svc");
  EXPECT_EQ(findings[0].origin.line, 3U);
  EXPECT_EQ(findings[0].value, "pam_nowhere.so");
}

TEST(CheckTest, AModuleMayBeMissingWhereTheLineSaysSo) {
  EXPECT_TRUE(Check({{"svc", "-session optional pam_nowhere.so\n"}}).empty());
  EXPECT_FALSE(Check({{"svc", "-session required pam_nowhere.so\n"}}).empty());
}

TEST(CheckTest, ALineThatNothingLeadsToIsFound) {
  EXPECT_EQ(Reasons(Check({{"svc", "session requisite pam_deny.so\nsession required pam_unix.so\n"}})),
            "nothing in the session stack of \"svc\" ever leads to this line\n");
}

TEST(CheckTest, ADenyThatNothingLeadsToIsNoFault) {
  EXPECT_EQ(Reasons(Check({{"svc",
                            "session [default=1] pam_permit.so\nsession requisite pam_deny.so\n"
                            "session required pam_permit.so\n"}})),
            "");
}

TEST(CheckTest, SyntaxErrorsAreFindings) {
  EXPECT_NE(Reasons(Check({{"svc", "session requird pam_unix.so\n"}})).find("cannot be understood"),
            std::string::npos);
}

TEST(CheckTest, WhatIsWrongInOtherIsItsOwnMatter) {
  EXPECT_EQ(Reasons(Check(
                {{"svc", "auth required pam_unix.so\n"}, {"other", "account required pam_nowhere.so\n"}})),
            "");
}

TEST(CheckTest, PeopleLogInWhereAPasswordIsAskedForAndAnAccountChecked) {
  EXPECT_TRUE(IsLogin({{"svc", "auth required pam_unix.so\n" + ACCOUNT}}));
  EXPECT_TRUE(IsLogin({{"svc", "@include part\n" + ACCOUNT}, {"part", "auth required pam_sss.so\n"}}));
  EXPECT_FALSE(IsLogin({{"svc", "auth required pam_unix.so\n"}, {"other", ACCOUNT}}));
  EXPECT_FALSE(IsLogin({{"svc", "auth required pam_rootok.so\n" + ACCOUNT}}));
  EXPECT_FALSE(IsLogin({{"other", "auth required pam_unix.so\n" + ACCOUNT}}, "other"));
}

}  // namespace

}  // namespace velmorctltest
