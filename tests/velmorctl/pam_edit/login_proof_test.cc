// What the proof says of changes that are no good, and of services that prove nothing.
#include "pam_edit/login_proof.h"

#include <gtest/gtest.h>

#include "pam/resolver.h"
#include "velmorctl/pam/policy_set.h"

namespace velmorctltest {

namespace {

using velmorctl::pam::Policy;
using velmorctl::pam::ResolvePolicy;
using velmorctl::pam::ShutOut;
using velmorctl::pam::UnsafeChange;

const std::string MODULE = "pam_x.so";

const std::string DENYING =
    "auth required pam_deny.so\naccount required pam_deny.so\npassword required pam_deny.so\n"
    "session required pam_deny.so\n";

const std::string AUTH = "auth sufficient pam_unix.so\nauth required pam_deny.so\n";
const std::string ACCOUNT = "account required pam_unix.so\n";

/// As it is put in.
const std::string AUTH_WITH_MODULE =
    "auth sufficient pam_unix.so\nauth [success=1 default=ignore] pam_localuser.so\nauth sufficient "
    "pam_x.so\n"
    "auth required pam_deny.so\n";
const std::string ACCOUNT_WITH_MODULE =
    "account [success=ok new_authtok_reqd=ok ignore=ignore user_unknown=ignore authinfo_unavail=ignore "
    "service_err=ignore system_err=ignore module_unknown=ignore default=bad] pam_x.so\n" +
    ACCOUNT;

/// A service beside an "other" that refuses everybody.
Policy ServiceWith(const std::string& content) {
  const PolicySet files = {{"svc", content}, {"other", DENYING}};
  return ResolvePolicy("svc", ReaderOf(files));
}

std::string Unsafe(const std::string& without, const std::string& with) {
  return UnsafeChange(ServiceWith(without), ServiceWith(with), MODULE);
}

std::string ShutOutOf(const std::string& without, const std::string& with) {
  return ShutOut(ServiceWith(without), ServiceWith(with), MODULE);
}

TEST(LoginProofTest, AGoodChangePasses) {
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT, AUTH_WITH_MODULE + ACCOUNT_WITH_MODULE), "");
}

TEST(LoginProofTest, LocalUsersMustNotBeShutOut) {
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT, "auth required pam_x.so\n" + AUTH + ACCOUNT),
            "it would shut out a local user with the right password (pam_authenticate answers user_unknown: "
            "pam_x (/etc/pam.d/svc:1) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, AnAnswerOfTheDirectoryMustNotShutLocalUsersOut) {
  const std::string account = "account [success=ok user_unknown=ignore default=bad] pam_x.so\n" + ACCOUNT;
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT, AUTH_WITH_MODULE + account),
            "it would shut out a local user with the right password, while the directory's module answers "
            "authinfo_unavail (pam_acct_mgmt answers authinfo_unavail: pam_x (/etc/pam.d/svc:5) answered "
            "authinfo_unavail, instead of success)");
}

TEST(LoginProofTest, LocalUsersMustNotBeLetIn) {
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT,
                   "auth sufficient pam_unix.so\nauth sufficient pam_x.so\nauth required pam_deny.so\n" +
                       ACCOUNT_WITH_MODULE),
            "it would let in a local user with a wrong password, though the directory has an account of the "
            "same name (pam_authenticate answers success: pam_x (/etc/pam.d/svc:2) answered success, instead "
            "of auth_err)");
}

TEST(LoginProofTest, LocalUsersMustBeRefusedAsBefore) {
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT,
                   "auth sufficient pam_unix.so\nauth requisite pam_x.so\nauth required pam_deny.so\n" +
                       ACCOUNT_WITH_MODULE),
            "it would refuse in another way a local user with a wrong password (pam_authenticate answers "
            "user_unknown: pam_x (/etc/pam.d/svc:2) answered user_unknown, instead of auth_err)");
}

TEST(LoginProofTest, ChangesOfPasswordMustEndAsBefore) {
  const std::string password = "password required pam_unix.so\n";
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT + password, AUTH + ACCOUNT + "password requisite pam_x.so\n" + password),
            "it would shut out a local user with the right password (pam_chauthtok answers user_unknown: "
            "pam_x (/etc/pam.d/svc:4) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, SessionsMustOpenAsBefore) {
  const std::string session = "session required pam_unix.so\n";
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT + session, AUTH + ACCOUNT + session + "session required pam_x.so\n"),
            "it would shut out a local user with the right password (pam_open_session answers user_unknown: "
            "pam_x (/etc/pam.d/svc:5) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, RootMustNotBeShutOut) {
  const std::string account =
      "account [success=1 default=ignore] pam_succeed_if.so uid >= 1000\naccount requisite pam_x.so\n";
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT, AUTH + account + ACCOUNT),
            "it would shut out root with the right password (pam_acct_mgmt answers user_unknown: pam_x "
            "(/etc/pam.d/svc:4) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, ALoginWithAKeyMustGetItsCredentialsAsBefore) {
  // Without a password to check, the first line ignores everybody and does not jump.
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT,
                   "auth [success=1 default=ignore] pam_succeed_if.so uid >= 0\nauth requisite pam_x.so\n" +
                       AUTH + ACCOUNT),
            "it would shut out a local user with the right password (pam_setcred answers user_unknown: pam_x "
            "(/etc/pam.d/svc:2) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, AccountsMustBeJudgedAsBeforeWhereNobodyIsAuthenticated) {
  const std::string auth = "auth required pam_deny.so\n";
  EXPECT_EQ(Unsafe(auth + ACCOUNT, auth + "account requisite pam_x.so\n" + ACCOUNT),
            "it would shut out a local user with the right password (pam_acct_mgmt answers user_unknown: "
            "pam_x (/etc/pam.d/svc:2) answered user_unknown, instead of success)");
}

TEST(LoginProofTest, NobodyOfTheDirectoryMustBeLetInWithAWrongPassword) {
  const std::string end = "auth requisite pam_deny.so\nauth required pam_permit.so\n";
  const std::string local = "auth [success=1 default=ignore] pam_unix.so\n";
  const std::string with =
      "auth [success=3 default=ignore] pam_unix.so\nauth [success=1 default=ignore] pam_localuser.so\n"
      "auth [success=1 auth_err=1 default=ignore] pam_x.so\n";
  EXPECT_EQ(Unsafe(local + end + ACCOUNT, with + end + ACCOUNT_WITH_MODULE),
            "it would let in a user of the directory with a wrong password (pam_authenticate answers "
            "success: pam_permit (/etc/pam.d/svc:5) answered success, after pam_unix user_unknown, "
            "pam_localuser perm_denied, pam_x auth_err)");
}

TEST(LoginProofTest, AnAccountThatTheDirectoryRefusesMustBeRefused) {
  EXPECT_EQ(Unsafe(AUTH + ACCOUNT, AUTH_WITH_MODULE + ACCOUNT),
            "it would let in a user of the directory, though the directory refuses the account with "
            "acct_expired (pam_authenticate answers success: pam_x (/etc/pam.d/svc:3) answered success)");
}

TEST(LoginProofTest, UsersOfTheDirectoryGetInWithoutAStackForSessions) {
  EXPECT_EQ(ShutOutOf(AUTH + ACCOUNT, AUTH_WITH_MODULE + ACCOUNT_WITH_MODULE), "");
}

TEST(LoginProofTest, UsersOfTheDirectoryWhoStayOutAreNamed) {
  EXPECT_EQ(ShutOutOf(AUTH + ACCOUNT, AUTH + ACCOUNT_WITH_MODULE),
            "a user of the directory would still not get in (pam_authenticate answers auth_err: pam_deny "
            "(/etc/pam.d/svc:2) answered auth_err, after pam_unix user_unknown)");
}

TEST(LoginProofTest, NothingCanBeProvedWhereNobodyGetsIn) {
  const std::string closed = "session required pam_deny.so\n";
  EXPECT_EQ(ShutOutOf(AUTH + ACCOUNT + closed, AUTH_WITH_MODULE + ACCOUNT_WITH_MODULE + closed),
            "it cannot be proved: no local user gets in as it is (pam_open_session answers session_err: "
            "pam_deny (/etc/pam.d/svc:4) answered session_err)");
}

TEST(LoginProofTest, AServiceForRootAloneLetsSomebodyIn) {
  const std::string account = "account requisite pam_succeed_if.so uid = 0\n";
  EXPECT_EQ(ShutOutOf(AUTH + account + ACCOUNT, AUTH_WITH_MODULE + account + ACCOUNT_WITH_MODULE),
            "a user of the directory would still not get in (pam_acct_mgmt answers auth_err: pam_succeed_if "
            "(/etc/pam.d/svc:5) answered auth_err)");
}

TEST(LoginProofTest, UsersOfTheDirectoryMayGetInWhereLocalOnesDoNot) {
  const std::string account = "account required pam_succeed_if.so uid >= 2000\n";
  EXPECT_EQ(ShutOutOf(AUTH + account + ACCOUNT, AUTH_WITH_MODULE + account + ACCOUNT_WITH_MODULE), "");
}

}  // namespace

}  // namespace velmorctltest
