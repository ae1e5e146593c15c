// Lines that were put into files to which libpam does not come any more, and files that nobody can read.
#include <sys/stat.h>

#include <filesystem>
#include <ostream>

#include "velmorctl/pam_edit/debian_root.h"
#include "velmorctl/prepared_host.h"

namespace velmorctltest {

namespace {

constexpr int NOT_READY = 7;

const std::string PLAIN = "auth required pam_unix.so\naccount required pam_unix.so\n";
const std::string INCLUDING = "auth include Part\naccount include Part\n";
const std::string BROKEN = "@include nowhere\n";

bool Contains(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

class PamUnusedPolicyTest : public PreparedHost {
 protected:
  std::string Policy(const std::string& name) const { return root_.Read("/etc/pam.d/" + name); }
  void Write(const std::string& name, const std::string& content) const {
    root_.Write("/etc/pam.d/" + name, content);
  }
  void Remove(const std::string& name) const { testsupport::RemoveFile(root_.Path() + "/etc/pam.d/" + name); }

  HostRoot root_;
};

TEST_F(PamUnusedPolicyTest, DisablingTakesLinesOutOfAServiceThatLibpamRefuses) {
  Write("ppp", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  Write("ppp", Policy("ppp") + BROKEN);
  const Outcome outcome = root_.Pam({"disable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(Policy("ppp"), PLAIN + BROKEN);
}

TEST_F(PamUnusedPolicyTest, DisablingTakesLinesOutOfAFileThatNobodyIncludesAnyMore) {
  Write("Part", PLAIN);
  Write("ppp", INCLUDING);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  ASSERT_NE(Policy("Part"), PLAIN);
  Remove("ppp");
  const Outcome outcome = root_.Pam({"disable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(Policy("Part"), PLAIN);
}

TEST_F(PamUnusedPolicyTest, DisablingTakesLinesOutOfWhatARefusedServiceIncludes) {
  const std::string part = "/etc/security/part";
  root_.Write(part, PLAIN);
  Write("ppp", "auth include " + part + "\naccount include " + part + "\n");
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  ASSERT_NE(root_.Read(part), PLAIN);
  Write("ppp", BROKEN + Policy("ppp"));
  const Outcome outcome = root_.Pam({"disable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(root_.Read(part), PLAIN);
}

TEST_F(PamUnusedPolicyTest, DisablingNamesTheAdministratorsLineInAServiceThatLibpamRefuses) {
  Write("ppp", PLAIN + "session optional pam_ctlscript mine\n" + BROKEN);
  const Outcome outcome = root_.Pam({"disable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_PRED2(Contains, outcome.errors, "/etc/pam.d/ppp, line 3 calls pam_ctlscript too");
}

TEST_F(PamUnusedPolicyTest, EnablingAgainTakesNoLineOutOfAServiceThatLibpamRefuses) {
  Write("login", PLAIN);
  Write("ppp", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  Write("ppp", Policy("ppp") + BROKEN);
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors, "the service 'ppp' cannot keep what was put into its files");
  EXPECT_PRED2(Contains, outcome.errors, "libpam refuses the service with abort: /etc/pam.d/ppp:");
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamUnusedPolicyTest, EnablingAgainGoesOnBesideARefusedServiceThatLosesNothing) {
  Write("login", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  Write("ppp", "auth include login\n" + BROKEN);
  const Tree before = root_.Files();
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(root_.Files(), before);
}

TEST_F(PamUnusedPolicyTest, EnablingAgainTakesLinesOutOfAFileThatNobodyIncludesAnyMore) {
  Write("Part", PLAIN);
  Write("ppp", INCLUDING);
  Write("login", PLAIN);
  ASSERT_EQ(root_.Pam({"enable"}).exitCode, 0);
  Remove("ppp");
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(Policy("Part"), PLAIN);
  EXPECT_NE(Policy("login"), PLAIN);
}

struct BadFile {
  std::string name;
  std::string reason;
  void (*make)(const std::string& path);
};

void PrintTo(const BadFile& file, std::ostream* stream) {
  *stream << file.name;
}

class PamBadFileTest : public PreparedHost, public ::testing::WithParamInterface<BadFile> {
 protected:
  PamBadFileTest() {
    root_.Write("/etc/pam.d/ppp", PLAIN);
    GetParam().make(root_.Path() + "/etc/pam.d/bad");
  }

  std::string Note() const {
    return "note: /etc/pam.d/bad cannot be read (" + GetParam().reason + "), and stays as it is.";
  }

  HostRoot root_;
};

TEST_P(PamBadFileTest, IsNamedAndLeftAloneByEnableAndDisable) {
  const Tree before = root_.Files();
  const Outcome enabled = root_.Pam({"enable"});
  EXPECT_EQ(enabled.exitCode, 0) << enabled.errors;
  EXPECT_PRED2(Contains, enabled.errors, Note());
  EXPECT_NE(root_.Read("/etc/pam.d/ppp"), PLAIN);
  const Outcome disabled = root_.Pam({"disable"});
  EXPECT_EQ(disabled.exitCode, 0) << disabled.errors;
  EXPECT_PRED2(Contains, disabled.errors, Note());
  EXPECT_EQ(root_.Files(), before);
}

TEST_P(PamBadFileTest, KeepsAServiceThatIncludesItFromBeingChanged) {
  const std::string text = "auth required pam_unix.so\nauth include bad\naccount required pam_unix.so\n";
  root_.Write("/etc/pam.d/needy", text);
  const Outcome outcome = root_.Pam({"enable"});
  EXPECT_EQ(outcome.exitCode, NOT_READY);
  EXPECT_PRED2(Contains, outcome.errors,
               "the service 'needy' stays as it is: it cannot be proved: no local user gets in as it is");
  EXPECT_EQ(root_.Read("/etc/pam.d/needy"), text);
  EXPECT_NE(root_.Read("/etc/pam.d/ppp"), PLAIN);
}

INSTANTIATE_TEST_SUITE_P(
    Each, PamBadFileTest,
    ::testing::Values(BadFile{"Binary", "it is no text file",
                              [](const std::string& path) {
                                testsupport::WriteFile(path, std::string("auth\0required\n", 14));
                              }},
                      BadFile{"Great", "it has more than a mebibyte, so it is no configuration file",
                              [](const std::string& path) {
                                testsupport::WriteFile(path, std::string((1 << 20) + 1, '#'));
                              }},
                      BadFile{"Circle", "Too many levels of symbolic links",
                              [](const std::string& path) { std::filesystem::create_symlink("bad", path); }},
                      BadFile{"Pipe", "it is not a regular file",
                              [](const std::string& path) { EXPECT_EQ(mkfifo(path.c_str(), 0644), 0); }}),
    [](const auto& parameter) { return parameter.param.name; });

TEST_F(PamUnusedPolicyTest, AFileThatOnlyRootMayReadIsNamedToOthers) {
  Write("ppp", PLAIN);
  Write("secret", PLAIN);
  testsupport::SetMode(root_.Path() + "/etc/pam.d/secret", 0);
  for (const std::string command : {"enable", "disable"}) {
    const Outcome outcome = Velmorctl({"pam", command, "--dry-run", "--root", root_.Path()}, WithoutRoot());
    EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
    EXPECT_PRED2(Contains, outcome.errors,
                 "note: /etc/pam.d/secret cannot be read (Permission denied), and stays as it is.");
  }
}

}  // namespace

}  // namespace velmorctltest
