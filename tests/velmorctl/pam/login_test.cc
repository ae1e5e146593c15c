#include "pam/login.h"

#include <gtest/gtest.h>

#include "pam/resolver.h"
#include "policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::AnswerOverride;
using velmorctl::pam::Circumstances;
using velmorctl::pam::CommonDirectoryModules;
using velmorctl::pam::Facility;
using velmorctl::pam::FindPerson;
using velmorctl::pam::LocalAdministrator;
using velmorctl::pam::LoginCall;
using velmorctl::pam::LoginExtent;
using velmorctl::pam::LoginOutcome;
using velmorctl::pam::NameOf;
using velmorctl::pam::ReadAnswerOverride;
using velmorctl::pam::ResolvePolicy;
using velmorctl::pam::ReturnCode;
using velmorctl::pam::SimulateEachCall;
using velmorctl::pam::SimulateLogin;

/// As pam-auth-update writes it for a host with a directory.
const PolicySet DEBIAN = {{"svc",
                           "auth [success=2 default=ignore] pam_unix.so nullok\n"
                           "auth [success=1 default=ignore] pam_winbind.so try_first_pass\n"
                           "auth requisite pam_deny.so\n"
                           "auth required pam_permit.so\n"
                           "account [success=2 new_authtok_reqd=done default=ignore] pam_unix.so\n"
                           "account [success=1 new_authtok_reqd=done default=ignore] pam_winbind.so\n"
                           "account requisite pam_deny.so\n"
                           "account required pam_permit.so\n"
                           "password required pam_unix.so\n"
                           "session required pam_unix.so\n"
                           "session optional pam_winbind.so\n"}};

class LoginTest : public ::testing::Test {
 protected:
  LoginTest() {
    circumstances.user = LocalAdministrator();
    circumstances.directoryModules = CommonDirectoryModules();
    circumstances.moduleExists = [](const std::string&) { return true; };
    circumstances.fileExists = [](const std::string&) { return false; };
  }

  LoginOutcome Login(const PolicySet& files, const std::vector<std::string>& answers = {}) const {
    std::vector<AnswerOverride> overrides;
    for (const std::string& answer : answers) {
      overrides.push_back(ReadAnswerOverride(answer).value());
    }
    return SimulateLogin(ResolvePolicy("svc", ReaderOf(files)), circumstances, overrides);
  }

  Circumstances circumstances;
};

TEST_F(LoginTest, ALocalUserGetsInWithAndWithoutTheDirectory) {
  for (bool up : {true, false}) {
    circumstances.directoryUp = up;
    const LoginOutcome outcome = Login(DEBIAN);
    EXPECT_TRUE(outcome.succeeds) << outcome.reason;
    EXPECT_EQ(outcome.calls.size(), 4U);
  }
}

TEST_F(LoginTest, AUserOfTheDirectoryNeedsIt) {
  circumstances.user = FindPerson("carol", {});
  EXPECT_TRUE(Login(DEBIAN).succeeds);
  circumstances.directoryUp = false;
  const LoginOutcome outcome = Login(DEBIAN);
  EXPECT_FALSE(outcome.succeeds);
  EXPECT_EQ(outcome.calls.size(), 1U);
  EXPECT_EQ(outcome.reason,
            "pam_authenticate answers auth_err: pam_deny (/etc/pam.d/svc:3) answered auth_err, "
            "after pam_unix user_unknown, pam_winbind authinfo_unavail");
}

TEST_F(LoginTest, AWrongPasswordDoesNotGetIn) {
  circumstances.rightPassword = false;
  EXPECT_FALSE(Login(DEBIAN).succeeds);
}

TEST_F(LoginTest, TheReasonOfASuccessIsWhatAuthenticated) {
  EXPECT_EQ(Login(DEBIAN).reason,
            "pam_authenticate answers success: pam_permit (/etc/pam.d/svc:4) answered success, after "
            "pam_unix success");
}

TEST_F(LoginTest, AnExpiredPasswordIsChangedOnTheWay) {
  const std::vector<std::string> expired = {"account:pam_unix=new_authtok_reqd"};
  const LoginOutcome outcome = Login(DEBIAN, expired);
  EXPECT_TRUE(outcome.succeeds) << outcome.reason;
  EXPECT_EQ(outcome.calls.size(), 6U);
  EXPECT_FALSE(Login(DEBIAN, {expired[0], "password:pam_unix=authtok_err"}).succeeds);
}

TEST_F(LoginTest, AnswersCanBeGivenForAStackAndAnOccurrence) {
  const PolicySet files = {{"svc",
                            "auth required a.so\nauth required a.so\naccount required a.so\n"
                            "session required a.so\n"}};
  EXPECT_TRUE(Login(files).succeeds);
  EXPECT_EQ(NameOf(Login(files, {"a=auth_err"}).calls.back().verdict.code), "auth_err");
  EXPECT_EQ(Login(files, {"account:a=acct_expired"}).calls.size(), 2U);
  const LoginOutcome second = Login(files, {"auth:a#2=maxtries"});
  EXPECT_EQ(second.reason, "pam_authenticate answers maxtries: a (/etc/pam.d/svc:2) answered maxtries");
  EXPECT_TRUE(Login(files, {"auth:a#3=maxtries"}).succeeds);
}

TEST_F(LoginTest, TheSessionCanRefuse) {
  EXPECT_EQ(Login(DEBIAN, {"session:pam_unix=session_err"}).calls.size(), 4U);
  EXPECT_FALSE(Login(DEBIAN, {"session:pam_unix=session_err"}).succeeds);
}

class LoginExtentTest : public LoginTest {
 protected:
  bool GetsIn(const std::string& session, LoginExtent extent) const {
    const PolicySet files = {{"svc", "auth required pam_unix.so\naccount required pam_unix.so\n" + session},
                             {"other", "session required pam_deny.so\n"}};
    return SimulateLogin(ResolvePolicy("svc", ReaderOf(files)), circumstances, {}, extent).succeeds;
  }
};

TEST_F(LoginExtentTest, TheSessionOfOtherCountsInAWholeLoginOnly) {
  EXPECT_FALSE(GetsIn("", LoginExtent::Whole));
  EXPECT_TRUE(GetsIn("", LoginExtent::OwnSession));
}

TEST_F(LoginExtentTest, TheServicesOwnSessionCountsUnlessAdmissionIsAsked) {
  EXPECT_FALSE(GetsIn("session required pam_deny.so\n", LoginExtent::OwnSession));
  EXPECT_TRUE(GetsIn("session required pam_deny.so\n", LoginExtent::Admission));
}

std::vector<std::string> Answers(const std::vector<LoginCall>& calls) {
  std::vector<std::string> answers;
  for (const LoginCall& call : calls) {
    answers.push_back(std::string(NameOf(call.operation)) + " " + NameOf(call.verdict.code));
  }
  return answers;
}

TEST_F(LoginTest, EachCallIsMadeWhateverTheOthersComeTo) {
  const PolicySet files = {{"svc",
                            "auth required pam_deny.so\naccount required pam_unix.so\n"
                            "password required pam_deny.so\nsession required pam_unix.so\n"}};
  EXPECT_EQ(Answers(SimulateEachCall(ResolvePolicy("svc", ReaderOf(files)), circumstances, {})),
            (std::vector<std::string>{"pam_authenticate auth_err", "pam_acct_mgmt success",
                                      "pam_chauthtok authtok_err", "pam_open_session success",
                                      "pam_close_session success", "pam_setcred cred_err"}));
}

TEST_F(LoginTest, CredentialsAreSetBehindAPasswordAndWithoutOne) {
  const PolicySet files = {{"svc",
                            "auth [success=1 default=ignore] pam_succeed_if.so uid >= 0\n"
                            "auth requisite pam_deny.so\nauth required pam_permit.so\n"}};
  EXPECT_EQ(Answers(SimulateEachCall(ResolvePolicy("svc", ReaderOf(files)), circumstances, {})),
            (std::vector<std::string>{"pam_authenticate success", "pam_setcred success",
                                      "pam_acct_mgmt perm_denied", "pam_chauthtok perm_denied",
                                      "pam_open_session perm_denied", "pam_setcred cred_err"}));
}

TEST_F(LoginTest, AStackWithoutLinesRefuses) {
  const LoginOutcome outcome = Login({{"svc", "auth required pam_permit.so\n"}});
  EXPECT_EQ(outcome.reason, "pam_acct_mgmt answers perm_denied: no line is for it");
}

TEST_F(LoginTest, AStackOfWhichAllIsIgnoredRefuses) {
  const LoginOutcome outcome = Login({{"svc", "auth optional pam_deny.so\n"}});
  EXPECT_EQ(outcome.reason, "pam_authenticate answers perm_denied: no module said yes or no");
}

TEST_F(LoginTest, APolicyThatLibpamRefusesLetsNobodyIn) {
  const LoginOutcome outcome = Login({{"svc", "auth required pam_permit.so\n@include nowhere\n"}});
  EXPECT_FALSE(outcome.succeeds);
  EXPECT_TRUE(outcome.calls.empty());
  EXPECT_NE(outcome.reason.find("/etc/pam.d/svc:2"), std::string::npos) << outcome.reason;
}

TEST_F(LoginTest, ALineThatAlwaysFailsIsNamed) {
  EXPECT_EQ(Login({{"svc", "auth required\n"}}).reason,
            "pam_authenticate answers perm_denied: the line /etc/pam.d/svc:1 always fails");
}

TEST(AnswerOverrideTest, HasFacilityModuleOccurrenceAndAnswer) {
  const std::optional<AnswerOverride> override = ReadAnswerOverride("auth:pam_unix.so#2=PAM_AUTH_ERR");
  ASSERT_TRUE(override);
  EXPECT_EQ(override->facility, Facility::Auth);
  EXPECT_EQ(override->module, "pam_unix");
  EXPECT_EQ(override->occurrence, 2U);
  EXPECT_EQ(override->answer, ReturnCode::AuthenticationError);
}

class BadOverrideTest : public ::testing::TestWithParam<const char*> {};

TEST_P(BadOverrideTest, IsRefused) {
  EXPECT_FALSE(ReadAnswerOverride(GetParam()));
}

INSTANTIATE_TEST_SUITE_P(Each, BadOverrideTest,
                         ::testing::Values("", "=", "pam_unix", "pam_unix=", "pam_unix=what", "=auth_err",
                                           "what:pam_unix=auth_err", "pam_unix#=auth_err",
                                           "pam_unix#0=auth_err", "pam_unix#x=auth_err",
                                           "pam_unix#1x=auth_err"));

}  // namespace

}  // namespace velmorctltest
