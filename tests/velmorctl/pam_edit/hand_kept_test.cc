// Policies that are kept by hand, in the shapes of several distributions.
#include <filesystem>
#include <ostream>

#include "velmorctl/pam_edit/debian_root.h"
#include "velmorctl/prepared_host.h"

namespace velmorctltest {

namespace {

constexpr int DIFFERENCE = 13;
constexpr int NOT_READY = 7;

using Files = std::map<std::string, std::string>;

struct Shape {
  std::string name;
  Files files;          // by their names in /etc/pam.d
  std::string service;  // through which people log in
  std::string other;    // a module that knows other users; may be empty
};

void PrintTo(const Shape& shape, std::ostream* stream) {
  *stream << shape.name;
}

// Lines that end in "sufficient", with a common file in a substack.
const Shape REDHAT = {
    "RedHat",
    {{"system-auth",
      "#%PAM-1.0\n"
      "# kept by hand\n"
      "auth        required      pam_env.so\n"
      "auth        sufficient    pam_unix.so try_first_pass nullok\n"
      "auth        required      pam_deny.so\n"
      "\n"
      "account     required      pam_unix.so\n"
      "account     sufficient    pam_localuser.so\n"
      "account     sufficient    pam_succeed_if.so uid < 500 quiet\n"
      "account     required      pam_permit.so\n"
      "\n"
      "password    requisite     pam_pwquality.so try_first_pass local_users_only retry=3\n"
      "password    sufficient    pam_unix.so try_first_pass use_authtok nullok sha512 shadow\n"
      "password    required      pam_deny.so\n"
      "\n"
      "session     optional      pam_keyinit.so revoke\n"
      "session     required      pam_limits.so\n"
      "-session    optional      pam_systemd.so\n"
      "session     [success=1 default=ignore] pam_succeed_if.so service in crond quiet use_uid\n"
      "session     required      pam_unix.so\n"},
     {"sshd",
      "#%PAM-1.0\n"
      "auth       substack     system-auth\n"
      "account    required     pam_nologin.so\n"
      "account    include      system-auth\n"
      "password   include      system-auth\n"
      "session    required     pam_loginuid.so\n"
      "session    include      system-auth\n"}},
    "sshd",
    ""};

// The same host with a module in front that only local users pass through.
const Shape GUARDED = {
    "Guarded",
    {{"login",
      "auth        required                                     pam_faillock.so preauth silent\n"
      "auth        [default=1 ignore=ignore success=ok]         pam_localuser.so\n"
      "auth        sufficient                                   pam_unix.so nullok\n"
      "auth        required                                     pam_faillock.so authfail\n"
      "auth        required                                     pam_deny.so\n"
      "account     required                                     pam_faillock.so\n"
      "account     sufficient                                   pam_unix.so\n"
      "account     required                                     pam_deny.so\n"
      "password    sufficient                                   pam_unix.so\n"
      "password    required                                     pam_deny.so\n"
      "session     required                                     pam_unix.so\n"}},
    "login",
    ""};

// "required" alone, in common files behind links.
const Shape SUSE = {
    "Suse",
    {{"common-auth-pc", "auth\trequired\tpam_env.so\t\nauth\trequired\tpam_unix.so\ttry_first_pass\n"},
     {"common-account-pc", "account\trequired\tpam_unix.so\ttry_first_pass\n"},
     {"common-password-pc",
      "password\trequisite\tpam_cracklib.so\npassword\trequired\tpam_unix.so\tuse_authtok nullok\n"},
     {"common-session-pc", "session\trequired\tpam_limits.so\nsession\trequired\tpam_unix.so\n"},
     {"login",
      "auth     requisite      pam_nologin.so\n"
      "auth     include        common-auth\n"
      "account  include        common-account\n"
      "password include        common-password\n"
      "session  required       pam_loginuid.so\n"
      "session  include        common-session\n"}},
    "login",
    ""};

// Jumps over what counts failures.
const Shape ARCH = {
    "Arch",
    {{"system-auth",
      "#%PAM-1.0\n"
      "\n"
      "auth       required                    pam_faillock.so      preauth\n"
      "-auth      [success=2 default=ignore]  pam_systemd_home.so\n"
      "auth       [success=1 default=bad]     pam_unix.so          try_first_pass nullok\n"
      "auth       [default=die]               pam_faillock.so      authfail\n"
      "auth       optional                    pam_permit.so\n"
      "auth       required                    pam_env.so\n"
      "auth       required                    pam_faillock.so      authsucc\n"
      "\n"
      "-account   [success=1 default=ignore]  pam_systemd_home.so\n"
      "account    required                    pam_unix.so\n"
      "account    optional                    pam_permit.so\n"
      "account    required                    pam_time.so\n"
      "\n"
      "-password  [success=1 default=ignore]  pam_systemd_home.so\n"
      "password   required                    pam_unix.so          try_first_pass nullok shadow\n"
      "password   optional                    pam_permit.so\n"
      "\n"
      "session    required                    pam_limits.so\n"
      "session    required                    pam_unix.so\n"},
     {"login",
      "auth required pam_securetty.so\nauth requisite pam_nologin.so\nauth include system-auth\n"
      "account required pam_nologin.so\naccount include system-auth\nsession include system-auth\n"
      "password include system-auth\n"}},
    "login",
    "pam_systemd_home"};

// A stack that somebody copied from Debian's common files, without the marks.
const Shape COPIED = {"Copied",
                      {{"vsftpd",
                        "auth [success=2 default=ignore] pam_userdb.so db=/etc/ftp\n"
                        "auth [success=1 default=ignore] pam_unix.so\n"
                        "auth requisite pam_deny.so\n"
                        "auth required pam_permit.so\n"
                        "account [success=1 new_authtok_reqd=done default=ignore] pam_unix.so\n"
                        "account requisite pam_deny.so\n"
                        "account required pam_permit.so"}},
                      "vsftpd",
                      "pam_userdb"};

// One line for each.
const Shape PLAIN = {
    "Plain", {{"ppp", "auth required pam_unix.so\naccount required pam_unix.so\n"}}, "ppp", ""};

// What ends the stack at once, whether it agrees or not.
const Shape DECIDING = {"Deciding",
                        {{"sssd-shadowutils",
                          "auth [success=done ignore=ignore default=die] pam_unix.so nullok try_first_pass\n"
                          "auth required pam_deny.so\n"
                          "account required pam_unix.so\naccount required pam_permit.so\n"}},
                        "sssd-shadowutils",
                        ""};

void WriteShape(const HostRoot& root, const Shape& shape) {
  for (const auto& [name, content] : shape.files) {
    root.Write("/etc/pam.d/" + name, content);
    if (name.ends_with("-pc")) {
      std::filesystem::create_symlink(name, root.Path() + "/etc/pam.d/" + name.substr(0, name.size() - 3));
    }
  }
}

class PamShapeTest : public PreparedHost, public ::testing::WithParamInterface<Shape> {
 protected:
  PamShapeTest() { WriteShape(root_, GetParam()); }

  bool LetsIn(const std::string& user, const std::string& directory,
              std::vector<std::string> answers = {}) const {
    if (!GetParam().other.empty()) {
      answers.push_back(GetParam().other + "=user_unknown");
    }
    return root_.LetsIn(GetParam().service, user, directory, answers);
  }

  HostRoot root_;
};

TEST_P(PamShapeTest, UsersOfTheDirectoryGetInAndLocalOnesToo) {
  ASSERT_FALSE(LetsIn("dora", "up"));
  const Outcome outcome = root_.Pam({"enable"});
  ASSERT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_TRUE(LetsIn("dora", "up"));
  EXPECT_TRUE(LetsIn("dora", "up", {"auth:pam_unix=auth_err"}));
  EXPECT_FALSE(LetsIn("dora", "down"));
  EXPECT_FALSE(LetsIn("dora", "up", {DirectoryAnswers("auth", "auth_err")}));
  EXPECT_FALSE(LetsIn("dora", "up", {DirectoryAnswers("account", "acct_expired")}));
  EXPECT_TRUE(LetsIn("local", "up"));
  EXPECT_TRUE(LetsIn("local", "down"));
  EXPECT_TRUE(LetsIn("local", "down", {DIRECTORY_MODULE + "=module_unknown"}));
  EXPECT_FALSE(LetsIn("local", "up", {"auth:pam_unix=auth_err"}));
  EXPECT_FALSE(LetsIn("local", "up", {"account:pam_unix=acct_expired"}));
  // The directory has an account of this name, too.
  const std::string yes = DirectoryAnswers("auth", "success");
  EXPECT_FALSE(LetsIn("local", "up", {"auth:pam_unix=auth_err", yes}));
  EXPECT_FALSE(LetsIn("root", "up", {"auth:pam_unix=auth_err", yes}));
}

TEST_P(PamShapeTest, DisablingGivesBackEveryByte) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"diff", "--enable"}).exitCode, DIFFERENCE);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_NE(root_.Files(), before);
  ASSERT_EQ(root_.Pam({"diff", "--disable"}).exitCode, DIFFERENCE);
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_P(PamShapeTest, RestoringGivesBackEveryByte) {
  const Tree before = root_.Files();
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  ASSERT_EQ(root_.Pam({"restore"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_P(PamShapeTest, EnablingTwiceChangesNothing) {
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree before = root_.Files();
  EXPECT_EQ(root_.Pam({"enable"}).output, "There is nothing to change.\n");
  EXPECT_EQ(root_.Files(), before);
}

INSTANTIATE_TEST_SUITE_P(Shapes, PamShapeTest,
                         ::testing::Values(REDHAT, GUARDED, SUSE, ARCH, COPIED, PLAIN, DECIDING),
                         [](const auto& parameter) { return parameter.param.name; });

class PamHandKeptTest : public PreparedHost {
 protected:
  bool Has(const std::string& file, const std::string& text) const {
    return root_.Read("/etc/pam.d/" + file).find(text) != std::string::npos;
  }

  HostRoot root_;
};

bool Contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

TEST_F(PamHandKeptTest, BehindASufficientLineStandsAnotherOne) {
  WriteShape(root_, REDHAT);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_TRUE(Has("system-auth",
                  "pam_unix.so try_first_pass nullok\n"
                  "# Added by \"velmorctl pam enable\": pam_localuser.so\n"
                  "auth\t[success=1 default=ignore]\tpam_localuser.so\n"
                  "# Added by \"velmorctl pam enable\": pam_ctlscript first second try_first_pass\n"
                  "auth\tsufficient\tpam_ctlscript first second try_first_pass\n"));
  EXPECT_TRUE(
      Has("system-auth", "password\tsufficient\tpam_ctlscript first second try_first_pass use_authtok\n"));
  EXPECT_TRUE(Has("system-auth", "session\toptional\tpam_ctlscript first second\n"));
}

TEST_F(PamHandKeptTest, JumpsAreCorrectedThatPassOverTheNewLine) {
  WriteShape(root_, ARCH);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_TRUE(Has("system-auth", "-auth      [success=4 default=ignore]  pam_systemd_home.so\n"));
  EXPECT_TRUE(Has("system-auth",
                  "auth\t[success=2 default=ignore]\tpam_ctlscript first second try_first_pass\n"
                  "auth       [success=1 default=bad]     pam_unix.so"));
}

TEST_F(PamHandKeptTest, TheFileBehindALinkIsEdited) {
  WriteShape(root_, SUSE);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::is_symlink(root_.Path() + "/etc/pam.d/common-auth"));
  EXPECT_TRUE(Has("common-auth-pc", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, AnotherProvidersLinesAreReplaced) {
  WriteShape(root_, PLAIN);
  const Tree before = root_.Files();
  root_.Write(
      "/etc/pam.d/ppp",
      "# Added by \"velmorctl pam enable\": pam_old.so\nauth\t[success=1 default=ignore]\tpam_old.so\n"
      "auth required pam_unix.so\n"
      "# Added by \"velmorctl pam enable\": pam_permit.so\nauth\trequired\tpam_permit.so\n"
      "account required pam_unix.so\n");
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_FALSE(Has("ppp", "pam_old.so"));
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
  ASSERT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamHandKeptTest, TheAdministratorsOwnLineStaysAndIsNamed) {
  root_.Write(
      "/etc/pam.d/ppp",
      "auth sufficient pam_ctlscript mine\nauth required pam_unix.so\naccount required pam_unix.so\n");
  const Tree before = root_.Files();
  const Outcome enabled = root_.Pam({"enable"});
  EXPECT_EQ(enabled.exitCode, 0) << enabled.errors;
  EXPECT_PRED2(Contains, enabled.errors, "/etc/pam.d/ppp, line 1 calls pam_ctlscript already");
  const Outcome disabled = root_.Pam({"disable"});
  EXPECT_EQ(disabled.exitCode, 0);
  EXPECT_PRED2(Contains, disabled.errors, "/etc/pam.d/ppp, line 1 calls pam_ctlscript too");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamHandKeptTest, AServiceWithoutAPlaceStaysAndTheOthersChange) {
  WriteShape(root_, PLAIN);
  const std::string odd = "auth optional pam_unix.so\naccount required pam_unix.so\n";
  root_.Write("/etc/pam.d/odd", odd);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors,
               "the service 'odd' stays as it is: auth: the control optional of pam_unix.so leaves no place");
  EXPECT_EQ(root_.Read("/etc/pam.d/odd"), odd);
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, ADifferenceIsToldBesideAServiceThatIsRefused) {
  WriteShape(root_, PLAIN);
  root_.Write("/etc/pam.d/odd", "auth optional pam_unix.so\naccount required pam_unix.so\n");
  const Outcome outcome = root_.Pam({"diff", "--enable"});
  EXPECT_EQ(outcome.exitCode, DIFFERENCE);
  EXPECT_PRED2(Contains, outcome.errors, "the service 'odd' stays as it is");
  EXPECT_PRED2(Contains, outcome.output, "+++ b/etc/pam.d/ppp");
}

TEST_F(PamHandKeptTest, ARefusalIsToldWhereNothingDiffers) {
  root_.Write("/etc/pam.d/odd", "auth optional pam_unix.so\naccount required pam_unix.so\n");
  const Outcome outcome = root_.Pam({"diff", "--enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "the service 'odd' stays as it is");
}

TEST_F(PamHandKeptTest, AServiceThatCannotBeProvedKeepsWhatItShares) {
  root_.Write("/etc/pam.d/shared", "auth sufficient pam_unix.so\nauth required pam_deny.so\n");
  // The jump of this one counts the lines of the file that it passes over.
  root_.Write(
      "/etc/pam.d/jumping",
      "auth [success=3 default=ignore] pam_userdb.so\nauth include shared\nauth required pam_deny.so\n"
      "auth required pam_permit.so\naccount required pam_unix.so\n");
  root_.Write("/etc/pam.d/plain", "auth include shared\naccount required pam_unix.so\n");
  root_.Write("/etc/pam.d/ppp", "auth required pam_unix.so\naccount required pam_unix.so\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors,
               "the service 'jumping' stays as it is: a jump of this entry would lead to another one: "
               "/etc/pam.d/jumping, line 1: pam_userdb.so");
  EXPECT_PRED2(Contains, outcome.errors,
               "the service 'plain' stays as it is: it shares /etc/pam.d/shared with jumping");
  EXPECT_FALSE(Has("shared", "pam_ctlscript"));
  EXPECT_FALSE(Has("plain", "pam_ctlscript"));
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, AServiceThatLetsNoUserOfTheDirectoryInAnywayStaysAsItIs) {
  const std::string text =
      "auth required pam_localuser.so\nauth required pam_unix.so\naccount required pam_unix.so\n"
      "session required pam_unix.so\n";
  root_.Write("/etc/pam.d/localonly", text);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "a user of the directory would still not get in");
  EXPECT_EQ(root_.Read("/etc/pam.d/localonly"), text);
}

const std::string DENYING_SESSIONS = "auth required pam_deny.so\nsession required pam_deny.so\n";

TEST_F(PamHandKeptTest, AServiceWithoutAStackForSessionsIsProvedWithoutOne) {
  WriteShape(root_, PLAIN);
  root_.Write("/etc/pam.d/other", DENYING_SESSIONS);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.errors, "");
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, AServiceWithoutAStackForSessionsThatLetsNoUserOfTheDirectoryInStaysAsItIs) {
  const std::string text =
      "auth required pam_localuser.so\nauth required pam_unix.so\naccount required pam_unix.so\n";
  root_.Write("/etc/pam.d/localonly", text);
  root_.Write("/etc/pam.d/other", DENYING_SESSIONS);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "a user of the directory would still not get in");
  EXPECT_EQ(root_.Read("/etc/pam.d/localonly"), text);
}

TEST_F(PamHandKeptTest, AServiceThatLetsNobodyInStaysAsItIs) {
  const std::string text =
      "auth required pam_unix.so\naccount required pam_unix.so\nsession required pam_deny.so\n";
  root_.Write("/etc/pam.d/closed", text);
  WriteShape(root_, PLAIN);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors,
               "the service 'closed' stays as it is: it cannot be proved: no local user gets in as it is "
               "(pam_open_session answers session_err: pam_deny (/etc/pam.d/closed:3) answered session_err)");
  EXPECT_EQ(root_.Read("/etc/pam.d/closed"), text);
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, AServiceThatLetsNobodyInHoldsUpNoneThatSharesItsFiles) {
  root_.Write("/etc/pam.d/shared", "auth required pam_unix.so\naccount required pam_unix.so\n");
  root_.Write("/etc/pam.d/closed",
              "auth requisite pam_deny.so\nauth include shared\naccount include shared\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_PRED2(Contains, outcome.errors,
               "note: the service 'closed' shares changed files with others, but it cannot be proved: no "
               "local user gets in as it is");
  EXPECT_TRUE(Has("shared", "pam_ctlscript"));
}

TEST_F(PamHandKeptTest, EnablingAgainTakesNoLineOutOfAServiceThatIsRefused) {
  WriteShape(root_, PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  std::string text = root_.Read("/etc/pam.d/ppp");
  text.replace(text.find("auth required pam_unix"), 13, "auth optional");
  root_.Write("/etc/pam.d/ppp", text);
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "the service 'ppp' cannot keep what was put into its files");
  EXPECT_PRED2(Contains, outcome.errors, "leaves no place beside it");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamHandKeptTest, LinksThatLeadNowhereHoldUpNoService) {
  WriteShape(root_, PLAIN);
  std::filesystem::create_symlink("circle", root_.Path() + "/etc/pam.d/circle");
  std::filesystem::create_symlink("nowhere", root_.Path() + "/etc/pam.d/lost");
  const Tree before = root_.Files();
  EXPECT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_TRUE(Has("ppp", "pam_ctlscript"));
  EXPECT_EQ(root_.Pam({"disable"}).exitCode, 0);
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamHandKeptTest, AFileOfAPackageIsNotEdited) {
  const std::string text = "auth required pam_unix.so\naccount required pam_unix.so\n";
  root_.Write("/usr/lib/pam.d/vendor", text);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "copy it to /etc/pam.d");
  EXPECT_EQ(root_.Read("/usr/lib/pam.d/vendor"), text);
}

TEST_F(PamHandKeptTest, OtherIsLeftAlone) {
  const std::string text = "auth required pam_unix.so\naccount required pam_unix.so\n";
  root_.Write("/etc/pam.d/other", text);
  root_.Write("/etc/pam.d/ppp", text);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  EXPECT_EQ(root_.Read("/etc/pam.d/other"), text);
}

TEST_F(PamHandKeptTest, AHostWithoutLoginServicesIsRefused) {
  root_.Write("/etc/pam.d/other", "auth required pam_deny.so\n");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "there is no service through which people log in");
  EXPECT_PRED2(Contains, outcome.errors, "velmorctl pam check --root " + root_.Path());
}

TEST_F(PamHandKeptTest, AParameterThatCannotStandInAPolicyIsRefused) {
  WriteShape(root_, PLAIN);
  root_.Write("/etc/quenix/velmor/provider.conf", "provider = \"bad_words\"\n");
  testsupport::CopyFile(VELMORCTL_BAD_PLUGIN_FOLDER "/libbad_words.so",
                        testsupport::PLUGIN_FOLDER + "libbad_words.so");
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 9);
  EXPECT_PRED2(Contains, outcome.errors, "cannot stand in a policy file");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamHandKeptTest, DiffNeedsADirection) {
  EXPECT_EQ(root_.Pam({"diff"}).exitCode, 2);
  EXPECT_EQ(root_.Pam({"diff", "--enable", "--disable"}).exitCode, 2);
}

}  // namespace

}  // namespace velmorctltest
