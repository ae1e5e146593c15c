#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

#include "support/files.h"
#include "velmorctl/program.h"

namespace velmorctltest {

namespace {

const std::string ROOT = "/run/root";
const std::string POLICIES = ROOT + "/etc/pam.d/";
const std::string MODULES = ROOT + "/usr/lib/x86_64-linux-gnu/security/";

/// A system below ROOT with two services, as Debian has them, and a directory.
class PamCommandTest : public ::testing::Test {
 protected:
  PamCommandTest() {
    testsupport::MakeFolders(POLICIES);
    testsupport::MakeFolders(MODULES);
    testsupport::MakeFolders(ROOT + "/etc/quenix/velmor");
    for (const char* module : {"deny", "permit", "unix", "winbind", "ctlscript", "env"}) {
      testsupport::WriteFile(MODULES + "pam_" + module + ".so", "");
    }
    testsupport::WriteFile(ROOT + "/etc/passwd",
                           "root:x:0:0:root:/root:/bin/bash\nalice:x:1000:1000::/home/alice:/bin/bash\n");
    testsupport::WriteFile(ROOT + "/etc/group", "alice:x:1000:\n");
    Policy("common-auth",
           "auth\t[success=2 default=ignore]\tpam_unix.so nullok\n"
           "auth\t[success=1 default=ignore]\tpam_winbind.so [try first]\n"
           "auth\trequisite\tpam_deny.so\n"
           "auth\trequired\tpam_permit.so\n");
    Policy("sshd",
           "@include common-auth\naccount required pam_unix.so\n"
           "account [default=ignore success=ok] pam_winbind.so\n"
           "session required pam_unix.so\n-session optional pam_systemd.so\n");
    Policy("other",
           "auth required pam_deny.so\naccount required pam_deny.so\nsession required pam_deny.so\n");
  }

  static void Policy(const std::string& name, const std::string& content) {
    testsupport::WriteFile(POLICIES + name, content);
  }

  static Outcome Pam(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), "pam");
    arguments.insert(arguments.end(), {"--root", ROOT});
    return Velmorctl(arguments);
  }

  static Outcome Simulate(const std::string& user, const std::string& directory,
                          const std::vector<std::string>& more = {}) {
    std::vector<std::string> arguments = {"simulate", "sshd", "--user", user, "--directory", directory};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return Pam(arguments);
  }
};

bool Has(const std::string& text, const std::string& part) {
  return text.find(part) != std::string::npos;
}

TEST_F(PamCommandTest, ShowsTheStacksWithTheirOrigin) {
  const Outcome outcome = Pam({"show", "sshd"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.errors, "");
  EXPECT_TRUE(outcome.output.starts_with("sshd\nFACILITY  CONTROL")) << outcome.output;
  EXPECT_TRUE(Has(outcome.output, "pam_winbind.so [try first]")) << outcome.output;
  EXPECT_TRUE(Has(outcome.output, POLICIES + "common-auth:2\n")) << outcome.output;
  EXPECT_TRUE(Has(outcome.output, "-session")) << outcome.output;
}

TEST_F(PamCommandTest, ShowsTheStacksAsJson) {
  const nlohmann::json document = Pam({"show", "sshd", "--json"}).Json();
  EXPECT_EQ(document["schema"], "velmor.pam/1");
  ASSERT_EQ(document["services"].size(), 1U);
  const nlohmann::json& service = document["services"][0];
  EXPECT_EQ(service["name"], "sshd");
  EXPECT_EQ(service["state"], "usable");
  EXPECT_EQ(service["stacks"]["password"]["entries"].size(), 0U);
  EXPECT_EQ(service["stacks"]["auth"]["entries"][1],
            (nlohmann::json{{"kind", "module"},
                            {"level", 0},
                            {"control", "[success=1 default=ignore]"},
                            {"module", "pam_winbind.so"},
                            {"arguments", {"try first"}},
                            {"quiet", false},
                            {"file", POLICIES + "common-auth"},
                            {"line", 2}}));
}

TEST_F(PamCommandTest, ShowsAllServicesButNotWhatPackagesLeaveBehind) {
  Policy("sshd.dpkg-old", "auth nonsense x.so\n");
  Policy("sshd~", "auth nonsense x.so\n");
  testsupport::MakeFolders(ROOT + "/usr/lib/pam.d");
  testsupport::WriteFile(ROOT + "/usr/lib/pam.d/vendor", "auth required pam_deny.so\n");
  const nlohmann::json document = Pam({"show", "--all", "--json"}).Json();
  std::vector<std::string> names;
  for (const nlohmann::json& service : document["services"]) {
    names.push_back(service["name"]);
  }
  EXPECT_EQ(names, (std::vector<std::string>{"common-auth", "other", "sshd", "vendor"}));
}

TEST_F(PamCommandTest, ShowTakesAServiceOrAll) {
  EXPECT_EQ(Pam({"show"}).exitCode, 2);
  EXPECT_EQ(Pam({"show", "sshd", "--all"}).exitCode, 2);
}

TEST_F(PamCommandTest, ShowWarnsOfFaults) {
  Policy("sshd", "auth requird pam_unix.so\n");
  const Outcome outcome = Pam({"show", "sshd"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_TRUE(
      Has(outcome.errors, "velmorctl: warning: " + POLICIES + "sshd:1: the control cannot be understood"))
      << outcome.errors;
}

TEST_F(PamCommandTest, FollowsLinksInsideTheRoot) {
  testsupport::RemoveFile(POLICIES + "common-auth");
  testsupport::MakeFolders(ROOT + "/etc/policies");
  testsupport::WriteFile(ROOT + "/etc/policies/auth", "auth required pam_deny.so\n");
  ASSERT_EQ(symlink("/etc/policies/auth", (POLICIES + "common-auth").c_str()), 0);
  EXPECT_TRUE(Has(Pam({"show", "sshd"}).output, "pam_deny.so"));
}

TEST_F(PamCommandTest, AMissingServiceIsAFailureThatNamesIt) {
  const Outcome outcome = Pam({"show", "nowhere"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_TRUE(Has(outcome.errors, "there is no service 'nowhere'")) << outcome.errors;
  EXPECT_TRUE(Has(outcome.errors, POLICIES + "nowhere")) << outcome.errors;
}

class BadServiceNameTest : public PamCommandTest, public ::testing::WithParamInterface<const char*> {};

TEST_P(BadServiceNameTest, IsRefused) {
  testsupport::WriteFile(ROOT + "/etc/secret", "auth required pam_unix.so\n");
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"show", GetParam()},
        std::vector<std::string>{"simulate", GetParam(), "--user", "alice", "--directory", "up"}}) {
    const Outcome outcome = Pam(arguments);
    EXPECT_EQ(outcome.exitCode, 2);
    EXPECT_TRUE(Has(outcome.errors, "cannot be the name of a service")) << outcome.errors;
  }
}

INSTANTIATE_TEST_SUITE_P(Each, BadServiceNameTest,
                         ::testing::Values("../secret", "a/sshd", "/etc/secret", "..", "."));

/// A file in the place of the policy that is none.
struct BadFile {
  const char* name;
  void (*make)(const std::string& path);
  const char* reason;
  const char* remedy;
  nlohmann::json line = nullptr;
  const char* value = "";
};

class BadFileTest : public PamCommandTest, public ::testing::WithParamInterface<BadFile> {};

TEST_P(BadFileTest, IsReportedAndNotFollowed) {
  GetParam().make(POLICIES + "bad");
  const Outcome shown = Pam({"show", "bad"});
  EXPECT_EQ(shown.exitCode, 11);
  EXPECT_TRUE(Has(shown.errors, GetParam().reason)) << shown.errors;
  EXPECT_LT(shown.errors.size(), 2000U);
  const Outcome checked = Pam({"check", "--json"});
  EXPECT_EQ(checked.exitCode, 13) << checked.errors;
  EXPECT_EQ(checked.Json()["findings"],
            (nlohmann::json{{{"file", POLICIES + "bad"},
                             {"line", GetParam().line},
                             {"value", GetParam().value},
                             {"reason", std::string("the file cannot be read: ") + GetParam().reason},
                             {"remedy", GetParam().remedy}}}));
}

constexpr char BINARY_REMEDY[] = "put a text file there, or move it away and restore a backup";

INSTANTIATE_TEST_SUITE_P(
    Each, BadFileTest,
    ::testing::Values(
        BadFile{"Binary",
                [](const std::string& path) {
                  testsupport::WriteFile(path, std::string("\x7f"
                                                           "ELF\x02\x01\0",
                                                           7));
                },
                "it is no text file", BINARY_REMEDY, 1, "0x7f"},
        BadFile{"NullByte",
                [](const std::string& path) {
                  testsupport::WriteFile(path, std::string("#\nauth required a.so\0\n", 22));
                },
                "it is no text file", BINARY_REMEDY, 2, "0x00"},
        BadFile{"HundredMegabytes",
                [](const std::string& path) {
                  testsupport::WriteFile(path, "auth required pam_unix.so\n");
                  ASSERT_EQ(truncate(path.c_str(), 100 << 20), 0);
                },
                "it has more than a mebibyte, so it is no configuration file", "put the right file there"},
        BadFile{"Pipe", [](const std::string& path) { ASSERT_EQ(mkfifo(path.c_str(), 0644), 0); },
                "it is not a regular file", "put a text file there"},
        BadFile{"LinkToItself", [](const std::string& path) { ASSERT_EQ(symlink("bad", path.c_str()), 0); },
                "Too many levels of symbolic links", "mend the symbolic links, which lead in a circle"}),
    [](const ::testing::TestParamInfo<BadFile>& bad) { return bad.param.name; });

TEST_F(PamCommandTest, ACircleOfLinksHidesNoOtherService) {
  ASSERT_EQ(symlink("second", (POLICIES + "first").c_str()), 0);
  ASSERT_EQ(symlink("first", (POLICIES + "second").c_str()), 0);
  const Outcome outcome = Pam({"show", "--all"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_TRUE(Has(outcome.output, POLICIES + "sshd:2")) << outcome.output;
  EXPECT_TRUE(Has(outcome.errors, POLICIES + "first:0: the file cannot be read: Too many")) << outcome.errors;
}

TEST_F(PamCommandTest, ALinkThatLeadsNowhereIsAFindingThatNamesItsTarget) {
  ASSERT_EQ(symlink("../nowhere", (POLICIES + "lost").c_str()), 0);
  const Outcome outcome = Pam({"check", "--json"});
  EXPECT_EQ(outcome.exitCode, 13);
  const nlohmann::json findings = outcome.Json()["findings"];
  ASSERT_EQ(findings.size(), 1U);
  EXPECT_EQ(findings[0]["file"], POLICIES + "lost");
  EXPECT_EQ(findings[0]["reason"],
            "the file cannot be read: it leads to '" + ROOT + "/etc/nowhere', which does not exist");
}

TEST_F(PamCommandTest, AModuleThatIsACircleOfLinksDoesNotExist) {
  ASSERT_EQ(symlink("pam_circle.so", (MODULES + "pam_circle.so").c_str()), 0);
  Policy("odd", "session required pam_circle.so\n");
  const Outcome outcome = Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 13);
  EXPECT_TRUE(Has(outcome.output, POLICIES + "odd:1: the module does not exist\n")) << outcome.output;
}

TEST_F(PamCommandTest, AFileWithCapitalsIsNoServiceAndAFinding) {
  Policy("Web", "auth required pam_deny.so\n");
  const Outcome outcome = Pam({"check", "--json"});
  EXPECT_EQ(outcome.exitCode, 13);
  EXPECT_EQ(outcome.Json()["findings"],
            (nlohmann::json{{{"file", POLICIES + "Web"},
                             {"line", nullptr},
                             {"value", "Web"},
                             {"reason",
                              "libpam never opens this file: it takes the name of a service in "
                              "lower case"},
                             {"remedy", "rename the file to lower case, or remove it"}}}));
  EXPECT_FALSE(Has(Pam({"show", "--all"}).output, "web"));
}

TEST_F(PamCommandTest, AFileWithCapitalsMayBeIncluded) {
  Policy("Common", "session required pam_permit.so\n");
  Policy("web", "@include Common\n");
  const Outcome outcome = Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
}

TEST_F(PamCommandTest, AFolderIsNoService) {
  testsupport::MakeFolders(POLICIES + "folder");
  EXPECT_EQ(Pam({"show", "folder"}).exitCode, 11);
  EXPECT_EQ(Pam({"check"}).exitCode, 0);
}

TEST_F(PamCommandTest, AnEndlessLineIsReadInPieces) {
  Policy("bad", "auth required pam_unix.so " + std::string(1 << 19, 'x'));
  const Outcome outcome = Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 13);
  EXPECT_TRUE(Has(outcome.output, "the line has more than 1023 bytes")) << outcome.output.substr(0, 2000);
  EXPECT_LT(outcome.output.size(), 20000U);
}

TEST_F(PamCommandTest, APolicyThatOnlyRootMayReadAsksForRoot) {
  testsupport::SetMode(POLICIES + "sshd", 0);
  const Outcome outcome = Velmorctl({"pam", "show", "sshd", "--root", ROOT}, WithoutRoot());
  EXPECT_EQ(outcome.exitCode, 77) << outcome.errors;
}

TEST_F(PamCommandTest, ARootWithoutPoliciesIsAFailure) {
  testsupport::MakeFolders("/run/empty");
  EXPECT_EQ(Velmorctl({"pam", "check", "--root", "/run/empty"}).exitCode, 11);
}

TEST_F(PamCommandTest, CheckFindsNothingInAGoodSystem) {
  const Outcome outcome = Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
}

TEST_F(PamCommandTest, CheckTellsFileLineValueAndRemedy) {
  Policy("sshd",
         "auth required pam_unix.so\naccount required pam_unix.so\nsession required pam_nowhere.so\n");
  const Outcome outcome = Pam({"check", "--json"});
  EXPECT_EQ(outcome.exitCode, 13);
  const nlohmann::json document = outcome.Json();
  EXPECT_EQ(document["schema"], "velmor.pam-check/1");
  const nlohmann::json& finding = document["findings"][0];
  EXPECT_EQ(finding["file"], POLICIES + "sshd");
  EXPECT_EQ(finding["line"], 3);
  EXPECT_EQ(finding["value"], "pam_nowhere.so");
  EXPECT_EQ(finding["reason"], "the module does not exist");
  EXPECT_NE(finding["remedy"], "");
}

TEST_F(PamCommandTest, CheckFindsWhoIsLockedOutWithoutTheDirectory) {
  Policy("common-auth", "auth requisite pam_winbind.so\n");
  Policy("sshd",
         "auth [success=ok user_unknown=ignore default=die] pam_winbind.so\nauth required pam_unix.so\n"
         "account required pam_unix.so\nsession required pam_unix.so\n");
  const Outcome outcome = Pam({"check"});
  EXPECT_EQ(outcome.exitCode, 13);
  EXPECT_TRUE(Has(outcome.output, "while the directory is away, root cannot log in")) << outcome.output;
}

TEST_F(PamCommandTest, ModulesAreNotLookedForWhereThereAreNone) {
  ASSERT_EQ(rename((ROOT + "/usr/lib").c_str(), (ROOT + "/usr/elsewhere").c_str()), 0);
  EXPECT_EQ(Pam({"check"}).exitCode, 0);
}

TEST_F(PamCommandTest, ALoginThatSucceedsEndsWithZero) {
  const Outcome outcome = Simulate("alice", "down");
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output << outcome.errors;
  EXPECT_TRUE(Has(outcome.output, "The login of 'alice' to 'sshd' would succeed: ")) << outcome.output;
  EXPECT_TRUE(Has(outcome.output, "pam_open_session")) << outcome.output;
}

TEST_F(PamCommandTest, ALoginThatFailsEndsWithThirteenAndSaysWhy) {
  const Outcome outcome = Simulate("carol", "down");
  EXPECT_EQ(outcome.exitCode, 13);
  EXPECT_TRUE(Has(outcome.output,
                  "The login of 'carol' to 'sshd' would fail: pam_authenticate answers auth_err: pam_deny "
                  "(/etc/pam.d/common-auth:3) answered auth_err, after pam_unix user_unknown, pam_winbind "
                  "authinfo_unavail\n"))
      << outcome.output;
  EXPECT_EQ(Simulate("carol", "up").exitCode, 0);
}

TEST_F(PamCommandTest, ALockedPasswordDoesNotGetIn) {
  testsupport::WriteFile(ROOT + "/etc/shadow", "alice:!:1::::::\n");
  EXPECT_EQ(Simulate("alice", "up").exitCode, 13);
}

TEST_F(PamCommandTest, AnswersCanBeGiven) {
  EXPECT_EQ(Simulate("alice", "up", {"--answer", "auth:pam_unix=auth_err"}).exitCode, 13);
  EXPECT_EQ(
      Simulate("carol", "down", {"--answer", "pam_winbind=success", "--answer", "account:pam_unix=success"})
          .exitCode,
      0);
  EXPECT_EQ(Simulate("alice", "up", {"--answer", "pam_unix=what"}).exitCode, 2);
}

TEST_F(PamCommandTest, ASimulationAsJsonHasEachStep) {
  const nlohmann::json document = Simulate("carol", "down", {"--json"}).Json();
  EXPECT_EQ(document["schema"], "velmor.pam-simulate/1");
  EXPECT_EQ(document["succeeds"], false);
  ASSERT_EQ(document["calls"].size(), 1U);
  EXPECT_EQ(document["calls"][0]["call"], "pam_authenticate");
  EXPECT_EQ(document["calls"][0]["verdict"], "auth_err");
  EXPECT_EQ(document["calls"][0]["steps"][1], (nlohmann::json{{"module", "pam_winbind.so"},
                                                              {"file", POLICIES + "common-auth"},
                                                              {"line", 2},
                                                              {"control", "[success=1 default=ignore]"},
                                                              {"answer", "authinfo_unavail"},
                                                              {"action", "ignore"},
                                                              {"badJump", false},
                                                              {"verdict", "perm_denied"},
                                                              {"note", "the directory is away"}}));
}

TEST_F(PamCommandTest, TheDirectoryIsUpOrDown) {
  EXPECT_EQ(Simulate("alice", "sideways").exitCode, 2);
}

TEST_F(PamCommandTest, TheProvidersModuleIsTheDirectory) {
  Policy("sshd",
         "auth required pam_ctlscript.so\naccount required pam_permit.so\nsession required pam_permit.so\n");
  EXPECT_EQ(Simulate("carol", "down").exitCode, 0);
  testsupport::CopyFile(VELMORCTL_SCRIPTED_PROVIDER, testsupport::PLUGIN_FOLDER + "libctlscript.so");
  testsupport::MakeFolders("/run/script");
  testsupport::WriteFile(ROOT + testsupport::PROVIDER_CONF, "provider = \"ctlscript\"\n");
  EXPECT_EQ(Simulate("carol", "down").exitCode, 13);
}

}  // namespace

}  // namespace velmorctltest
