// Why a service or a file is left as it is, in the words of the command; and runs that only show a change.
#include "velmorctl/pam_edit/debian_root.h"
#include "velmorctl/prepared_host.h"

namespace velmorctltest {

namespace {

constexpr int DIFFERENCE = 13;
constexpr int NOT_READY = 7;

const std::string PLAIN = "auth required pam_unix.so\naccount required pam_unix.so\n";

bool Contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

class PamRefusalTest : public PreparedHost {
 protected:
  /// The service must stay as it is for this reason, and no other file may change.
  void ExpectRefused(const std::string& service, const std::string& text, const std::string& reason) const {
    root_.Write("/etc/pam.d/" + service, text);
    const Tree before = root_.Files();
    const Outcome outcome = root_.Pam({"enable"});
    EXPECT_EQ(outcome.exitCode, NOT_READY);
    EXPECT_PRED2(Contains, outcome.errors, "the service '" + service + "' stays as it is: " + reason);
    EXPECT_EQ(root_.Files(), before);
  }

  void ExpectDisablingRefused(const std::string& reason) const {
    const Tree before = root_.Files();
    const Outcome outcome = root_.Pam({"disable"});
    EXPECT_EQ(outcome.exitCode, NOT_READY);
    EXPECT_PRED2(Contains, outcome.errors, reason);
    EXPECT_PRED2(Contains, outcome.errors, "velmorctl pam restore --root " + root_.Path() + ", if nothing");
    EXPECT_EQ(root_.Files(), before);
  }

  HostRoot root_;
};

TEST_F(PamRefusalTest, AStackThatIsIncludedFromOther) {
  root_.Write("/etc/pam.d/other", PLAIN);
  ExpectRefused("ppp", "auth include other\naccount include other\n",
                "auth: it has no stack of its own for this, and the service \"other\" is left alone");
}

TEST_F(PamRefusalTest, AStackWithoutTheLocalUsersModule) {
  ExpectRefused("ppp", "auth required pam_unix.so\naccount required pam_permit.so\n",
                "account: pam_unix.so is not there to put the module beside it");
}

TEST_F(PamRefusalTest, AJumpThatWouldNotBeWrittenAsBefore) {
  ExpectRefused("ppp",
                "auth [success=01 default=ignore] pam_unix.so\nauth requisite pam_deny.so\n"
                "auth required pam_permit.so\naccount required pam_unix.so\n",
                "the change of /etc/pam.d/ppp could not be undone byte for byte");
}

TEST_F(PamRefusalTest, TheAdministratorsLineThatLetsNobodyIn) {
  ExpectRefused("ppp", "auth optional pam_ctlscript\n" + PLAIN,
                "/etc/pam.d/ppp, line 1 calls pam_ctlscript already, but a user of the directory would still "
                "not get in");
}

TEST_F(PamRefusalTest, DisablingWhereAJumpCountsTheLinesThatGo) {
  root_.Write("/etc/pam.d/shared", "auth sufficient pam_unix.so\naccount required pam_unix.so\n");
  root_.Write("/etc/pam.d/ppp", "auth include shared\naccount include shared\n");
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  root_.Write(
      "/etc/pam.d/jumping",
      "auth [success=4 default=ignore] pam_userdb.so\nauth include shared\nauth required pam_deny.so\n"
      "auth required pam_permit.so\naccount required pam_unix.so\n");
  ExpectDisablingRefused("a jump of this entry would lead to another one: /etc/pam.d/jumping, line 1");
}

TEST_F(PamRefusalTest, DisablingWhereTheModelReadsTheFileAnotherWay) {
  // For libpam the bracket that nobody closes ends with its line, for the library's model with the next "]".
  root_.Write("/etc/pam.d/ppp",
              "auth [success=ok pam_env.so\n"
              "# Added by \"velmorctl pam enable\": pam_ctlscript\n"
              "auth\t[success=1 default=ignore]\tpam_ctlscript\n" +
                  PLAIN);
  ExpectDisablingRefused("read another way, it would change in more than was asked for");
}

TEST_F(PamRefusalTest, ADryRunOfDisableShowsTheDifferenceAndWritesNothing) {
  root_.Write("/etc/pam.d/ppp", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree before = root_.Files();
  const Outcome diff = root_.Pam({"diff", "--disable"});
  EXPECT_EQ(diff.exitCode, DIFFERENCE);
  EXPECT_PRED2(Contains, diff.output, "-account\t[success=ok");
  const Outcome outcome = root_.Pam({"disable", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.output, diff.output + "Nothing was written.\n");
  EXPECT_EQ(root_.Files(), before);
  EXPECT_EQ(root_.Pam({"backups", "--json"}).Json()["backups"].size(), 1U);
}

TEST_F(PamRefusalTest, ADryRunOfRestoreShowsTheDifferenceAndWritesNothing) {
  root_.Write("/etc/pam.d/ppp", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"restore", "--dry-run"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.output, root_.Pam({"diff", "--disable"}).output + "Nothing was written.\n");
  EXPECT_EQ(root_.Files(), before);
  EXPECT_EQ(root_.Pam({"backups", "--json"}).Json()["backups"].size(), 1U);
}

class PamProfileRefusalTest : public PreparedHost {
 protected:
  /// With a profile tool that does this too, once it has done its work.
  void ExpectRefused(const std::string& more, const std::string& reason) const {
    const Tree before = root_.Files();
    const StandInForProfileTool tool("\"$REAL\" \"$@\"\n" + more);
    const Outcome outcome = root_.Pam({"enable"});
    EXPECT_EQ(outcome.exitCode, NOT_READY);
    EXPECT_PRED2(Contains, outcome.errors, "the service 'sshd' stays as it is: " + reason);
    EXPECT_EQ(root_.Files().at("/etc/pam.d/common-auth"), before.at("/etc/pam.d/common-auth"));
  }

  DebianRoot root_;
};

TEST_F(PamProfileRefusalTest, AFileThatLibpamWouldRefuse) {
  ExpectRefused("echo '@include nowhere' >>\"$2/etc/pam.d/common-auth\"\n",
                "libpam would not read it as before");
}

TEST_F(PamProfileRefusalTest, AnEntryThatWouldBeLost) {
  ExpectRefused("sed -i '/^account.*pam_permit.so/d' \"$2/etc/pam.d/common-account\"\n",
                "this entry would be lost: /etc/pam.d/common-account");
}

TEST_F(PamProfileRefusalTest, AFileThatTheModelWouldReadAnotherWay) {
  // A comment for libpam, and two more parameters for the library's model.
  ExpectRefused("sed -i '/^auth.*pam_permit.so/s/$/ # enough/' \"$2/etc/pam.d/common-auth\"\n",
                "read another way, /etc/pam.d/common-auth would change in more than was asked for");
}

}  // namespace

}  // namespace velmorctltest
