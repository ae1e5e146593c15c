#include <gtest/gtest.h>

#include <filesystem>

#include "plugins/scripted_plugin.h"
#include "prepared_host.h"

namespace velmorctltest {

namespace {

using testsupport::AUTHENTICATION_CONF;
using testsupport::PROVIDER_CONF;
using testsupport::ReadFile;
using testsupport::WriteFile;

class StoreTest : public PreparedHost {};

TEST_F(StoreTest, ListsTheStoresAndMarksTheActiveOne) {
  EXPECT_EQ(Velmorctl({"store", "list"}).output,
            "STORE             ACTIVE\n"
            "Active Directory  no\n"
            "None              yes\n");
  EXPECT_EQ(Velmorctl({"store", "list", "--json"}).Json(), nlohmann::json::parse(R"({
    "schema": "velmor.store-list/1",
    "stores": [{"name": "Active Directory", "active": false}, {"name": "None", "active": true}]
  })"));
}

TEST_F(StoreTest, ShowsTheActiveStore) {
  EXPECT_EQ(Velmorctl({"store", "show"}).output, "None\n");
  EXPECT_EQ(Velmorctl({"store", "show", "--json"}).Json(),
            (nlohmann::json{{"schema", "velmor.store/1"}, {"name", "None"}, {"file", AUTHENTICATION_CONF}}));
}

TEST_F(StoreTest, MakesAStoreActive) {
  EXPECT_EQ(Velmorctl({"store", "use", "Active Directory"}).exitCode, 0);
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "remote-authentication-store = \"Active Directory\"\n");
  EXPECT_EQ(Velmorctl({"store", "use", "None"}).exitCode, 0);
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "remote-authentication-store = \"None\"\n");
}

TEST_F(StoreTest, RefusesAnUnknownName) {
  const Outcome outcome = Velmorctl({"store", "use", "none"});
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_NE(outcome.errors.find("\"Active Directory\" or \"None\""), std::string::npos) << outcome.errors;
}

TEST_F(StoreTest, RefusesToActivateADirectoryWithoutItsProvider) {
  testsupport::RemoveFile(PROVIDER_CONF);
  EXPECT_EQ(Velmorctl({"store", "use", "Active Directory"}).exitCode, 9);
  EXPECT_EQ(ActiveStore(), "None");
}

TEST_F(StoreTest, GoesBackToNoneThoughTheStoreOfBeforeIsBroken) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = \"Active Directory\"\n");
  testsupport::RemoveFile(PROVIDER_CONF);
  const Outcome outcome = Velmorctl({"store", "use", "None"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_NE(outcome.errors.find("warning: "), std::string::npos) << outcome.errors;
  EXPECT_EQ(ActiveStore(), "None");
}

TEST_F(StoreTest, GoesBackToNoneFromAnUnknownStore) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = \"Elsewhere\"\n");
  EXPECT_EQ(Velmorctl({"store", "use", "None"}).exitCode, 0);
  EXPECT_EQ(ActiveStore(), "None");
}

TEST_F(StoreTest, KeepsThePermissionsOfItsFile) {
  testsupport::SetMode(AUTHENTICATION_CONF, 0640);
  EXPECT_EQ(Velmorctl({"store", "use", "Active Directory"}).exitCode, 0);
  EXPECT_EQ(testsupport::ModeOf(AUTHENTICATION_CONF), 0640U);
}

struct BrokenFile {
  const char* name;
  const char* content;
  const char* line;
  const char* value;
  const char* reason;
};

void PrintTo(const BrokenFile& broken, std::ostream* stream) {
  *stream << broken.name;
}

std::string NameOf(const ::testing::TestParamInfo<BrokenFile>& test) {
  return test.param.name;
}

class BrokenAuthenticationFileTest : public PreparedHost, public ::testing::WithParamInterface<BrokenFile> {};

TEST_P(BrokenAuthenticationFileTest, IsReportedWithFileLineValueAndRemedy) {
  const BrokenFile& broken = GetParam();
  WriteFile(AUTHENTICATION_CONF, broken.content);
  const Outcome outcome = Velmorctl({"store", "show"});
  EXPECT_EQ(outcome.exitCode, 11);
  std::string expected = "  file:     " + AUTHENTICATION_CONF + "\n";
  if (broken.line[0] != '\0') {
    expected += std::string("  line:     ") + broken.line + "\n";
  }
  if (broken.value[0] != '\0') {
    expected += std::string("  value:    ") + broken.value + "\n";
  }
  expected += std::string("  reason:   ") + broken.reason;
  EXPECT_NE(outcome.errors.find(expected), std::string::npos) << outcome.errors << "\nwanted\n" << expected;
  EXPECT_NE(outcome.errors.find("\n  try:      "), std::string::npos) << outcome.errors;
}

INSTANTIATE_TEST_SUITE_P(
    Each, BrokenAuthenticationFileTest,
    ::testing::Values(
        BrokenFile{"Empty", "", "", "", "it has no line for the key \"remote-authentication-store\""},
        BrokenFile{"OtherKey", "store = \"None\"\n", "", "", "it has no line for the key"},
        BrokenFile{"Comment", "\n# a comment\nremote-authentication-store = \"None\"\n", "2", "# a comment",
                   "the line has no \"=\""},
        BrokenFile{"LoneQuote", "remote-authentication-store = \"\n", "1", "remote-authentication-store = \"",
                   "a quote stands alone"},
        BrokenFile{"LoneQuoteAsKey", "' = x\nremote-authentication-store = \"None\"\n", "1", "' = x",
                   "a quote stands alone"},
        BrokenFile{"NoValue", "remote-authentication-store = \"\"\n", "1", "", "the key"},
        BrokenFile{"UnknownStore", "\nremote-authentication-store = \"none\"\n", "2", "none",
                   "there is no store of this name; there are \"Active Directory\" and \"None\""},
        BrokenFile{"OpenQuote", "remote-authentication-store = \"None\n", "1", "\"None",
                   "the quotes around the value do not match"},
        BrokenFile{"CarriageReturn", "remote-authentication-store = \"None\"\r\n", "1", "\"None\"?",
                   "the line ends in a carriage return"}),
    NameOf);

TEST_F(StoreTest, ReportsAMissingFile) {
  testsupport::RemoveFile(AUTHENTICATION_CONF);
  const Outcome outcome = Velmorctl({"store", "show"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("file:     " + AUTHENTICATION_CONF + "\n  reason:   it does not exist\n"),
            std::string::npos)
      << outcome.errors;
}

TEST_F(StoreTest, ReportsAFolderInTheFilesPlace) {
  testsupport::RemoveFile(AUTHENTICATION_CONF);
  testsupport::MakeFolders(AUTHENTICATION_CONF);
  const Outcome outcome = Velmorctl({"store", "show"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("it is not a file"), std::string::npos) << outcome.errors;
}

TEST_F(StoreTest, ReportsTheLineThatStopsAChange) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = \"None\"\nnonsense\n");
  const Outcome outcome = Velmorctl({"store", "use", "Active Directory"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("line:     2\n  value:    nonsense\n"), std::string::npos) << outcome.errors;
  EXPECT_NE(outcome.errors.find("changed:  nothing\n"), std::string::npos) << outcome.errors;
}

class BrokenProviderFileTest : public PreparedHost {
 protected:
  /// What a command says that needs the provider.
  static Outcome Ask() { return Velmorctl({"trust", "show"}); }
};

TEST_F(BrokenProviderFileTest, IsNineWhenItIsMissing) {
  testsupport::RemoveFile(PROVIDER_CONF);
  const Outcome outcome = Ask();
  EXPECT_EQ(outcome.exitCode, 9);
  EXPECT_NE(outcome.errors.find("file:     " + PROVIDER_CONF + "\n  reason:   it does not exist\n"),
            std::string::npos)
      << outcome.errors;
  EXPECT_NE(outcome.errors.find("try:      velmorctl provider use "), std::string::npos) << outcome.errors;
}

TEST_F(BrokenProviderFileTest, IsNineWhenItNamesNoProvider) {
  WriteFile(PROVIDER_CONF, "provider = \"\"\n");
  const Outcome outcome = Ask();
  EXPECT_EQ(outcome.exitCode, 9);
  EXPECT_NE(outcome.errors.find("line:     1\n"), std::string::npos) << outcome.errors;
}

TEST_F(BrokenProviderFileTest, IsElevenWhenALineIsMalformed) {
  WriteFile(PROVIDER_CONF, "provider = \"ctlscript\"\n\nnonsense\n");
  const Outcome outcome = Ask();
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("file:     " + PROVIDER_CONF + "\n  line:     3\n  value:    nonsense\n"),
            std::string::npos)
      << outcome.errors;
}

class ProviderTest : public PreparedHost {
 protected:
  static nlohmann::json List() { return Velmorctl({"provider", "list", "--json"}).Json()["providers"]; }

  /// The entry of that name, or null.
  static nlohmann::json Entry(const nlohmann::json& providers, const std::string& name) {
    for (const nlohmann::json& provider : providers) {
      if (provider["name"] == name) {
        return provider;
      }
    }
    return nullptr;
  }

  static nlohmann::json Listed(const std::string& name) { return Entry(List(), name); }
};

TEST_F(ProviderTest, ListsThePluginsAndMarksTheOneInUse) {
  testsupport::InstallPlugin("version2");
  EXPECT_EQ(Velmorctl({"provider", "list"}).output,
            "PROVIDER   IN USE  VERSION  STATE\n"
            "ctlscript  yes     3        usable\n"
            "version2   no      2        usable\n");
  EXPECT_EQ(Velmorctl({"provider", "list", "--json"}).Json()["schema"], "velmor.provider-list/1");
}

TEST_F(ProviderTest, ListsNothingWhenThereIsNothing) {
  testsupport::RemoveFile(testsupport::PLUGIN_FOLDER + "libctlscript.so");
  const Outcome outcome = Velmorctl({"provider", "list", "--json"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.Json()["providers"], nlohmann::json::array());
}

TEST_F(ProviderTest, PassesOverFilesThatAreNoPlugins) {
  WriteFile(testsupport::PLUGIN_FOLDER + "velmor-helper", "x");
  WriteFile(testsupport::PLUGIN_FOLDER + "lib.so", "x");
  EXPECT_EQ(Velmorctl({"provider", "list", "--json"}).Json()["providers"].size(), 1U);
}

TEST_F(ProviderTest, PrefersTheFileThatTheLibraryPrefers) {
  testsupport::MakeFolders(testsupport::PLUGIN_FOLDER + "lib64");
  testsupport::CopyFile(VELMORCTL_SCRIPTED_PROVIDER, testsupport::PLUGIN_FOLDER + "lib64/libctlscript.so");
  EXPECT_EQ(Listed("ctlscript")["file"], testsupport::PLUGIN_FOLDER + "lib64/libctlscript.so");
}

TEST_F(ProviderTest, ShowsWhatThePluginSaysOfItself) {
  const nlohmann::json document = Velmorctl({"provider", "show", "--json"}).Json();
  EXPECT_EQ(document["schema"], "velmor.provider/1");
  EXPECT_EQ(document["name"], "ctlscript");
  EXPECT_EQ(document["apiVersion"], 3);
  EXPECT_EQ(document["pamModule"], "pam_ctlscript");
  EXPECT_EQ(document["pamModuleParameters"], "first second");
  EXPECT_EQ(document["nssModuleParameters"], "");
  EXPECT_EQ(document["operations"]["joinDomain"], true);
  EXPECT_EQ(document["operations"]["convertCanonicalUsername"], false);
}

TEST_F(ProviderTest, WritesTheChoiceIntoAnExistingFileAndKeepsTheRest) {
  testsupport::InstallPlugin("version2");
  WriteFile(PROVIDER_CONF, "provider = \"ctlscript\"\nother = 'kept'\n");
  testsupport::SetMode(PROVIDER_CONF, 0600);
  EXPECT_EQ(Velmorctl({"provider", "use", "version2"}).exitCode, 0);
  EXPECT_EQ(ReadFile(PROVIDER_CONF), "other = \"kept\"\nprovider = \"version2\"\n");
  EXPECT_EQ(testsupport::ModeOf(PROVIDER_CONF), 0600U);
  EXPECT_EQ(testsupport::NamesIn(testsupport::CONFIGURATION_FOLDER),
            (std::vector<std::string>{"authentication.conf", "provider.conf"}));
}

TEST_F(ProviderTest, WritesThroughALinkInTheFilesPlace) {
  const std::string target = "/etc/quenix/provider.conf";
  WriteFile(target, "");
  testsupport::RemoveFile(PROVIDER_CONF);
  std::filesystem::create_symlink(target, PROVIDER_CONF);
  EXPECT_EQ(Velmorctl({"provider", "use", "ctlscript"}).exitCode, 0);
  EXPECT_TRUE(std::filesystem::is_symlink(PROVIDER_CONF));
  EXPECT_EQ(ReadFile(target), "provider = \"ctlscript\"\n");
}

TEST_F(ProviderTest, MakesTheFileWhenThereIsNone) {
  testsupport::RemoveFile(PROVIDER_CONF);
  EXPECT_EQ(Velmorctl({"provider", "use", "ctlscript"}).exitCode, 0);
  EXPECT_EQ(ReadFile(PROVIDER_CONF), "provider = \"ctlscript\"\n");
  EXPECT_EQ(testsupport::ModeOf(PROVIDER_CONF), 0644U);
}

TEST_F(ProviderTest, AddsTheKeyToAFileWithoutIt) {
  WriteFile(PROVIDER_CONF, "other = \"kept\"\n");
  EXPECT_EQ(Velmorctl({"provider", "use", "ctlscript"}).exitCode, 0);
  EXPECT_EQ(ReadFile(PROVIDER_CONF), "other = \"kept\"\nprovider = \"ctlscript\"\n");
}

TEST_F(ProviderTest, LeavesAMalformedFileAsItIs) {
  WriteFile(PROVIDER_CONF, "nonsense\n");
  EXPECT_EQ(Velmorctl({"provider", "use", "ctlscript"}).exitCode, 11);
  EXPECT_EQ(ReadFile(PROVIDER_CONF), "nonsense\n");
}

TEST_F(ProviderTest, RefusesANameThatIsAPath) {
  EXPECT_EQ(Velmorctl({"provider", "use", "../evil"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"provider", "use", "a\"b"}).exitCode, 2);
}

TEST_F(ProviderTest, WarnsWhenTheHostIsJoinedWithAnother) {
  MakeJoined();
  testsupport::InstallPlugin("version2");
  const Outcome outcome = Velmorctl({"provider", "use", "version2"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_NE(outcome.errors.find("joined with the provider 'ctlscript'"), std::string::npos) << outcome.errors;
}

struct BrokenPlugin {
  const char* name;
  const char* reason;
};

void PrintTo(const BrokenPlugin& broken, std::ostream* stream) {
  *stream << broken.reason;
}

class BrokenPluginTest : public ProviderTest, public ::testing::WithParamInterface<BrokenPlugin> {
 protected:
  static void Install(const std::string& name) {
    const std::string installed = testsupport::InstalledPlugin(name);
    if (name == "truncated") {
      WriteFile(installed, ReadFile(VELMORCTL_SCRIPTED_PROVIDER).substr(0, 5000));
    } else if (name == "short") {
      WriteFile(installed, ReadFile(VELMORCTL_SCRIPTED_PROVIDER).substr(0, 20));
    } else if (name == "text") {
      WriteFile(installed,
                "This is text, and longer than any header of a shared object, which has 64 bytes.\n");
    } else if (name == "empty") {
      WriteFile(installed, "");
    } else if (name.starts_with("bad_")) {
      testsupport::CopyFile(std::string(VELMORCTL_BAD_PLUGIN_FOLDER "/lib") + name + ".so", installed);
    } else if (name != "missing") {
      testsupport::InstallPlugin(name);
    }
    testsupport::ConfigureProvider(name);
  }
};

TEST_P(BrokenPluginTest, IsReportedWithFileReasonAndRemedy) {
  const std::string name = GetParam().name;
  Install(name);
  const Outcome outcome = Velmorctl({"trust", "show"});
  EXPECT_EQ(outcome.exitCode, 9) << outcome.errors;
  EXPECT_NE(outcome.errors.find("file:     " + testsupport::InstalledPlugin(name) +
                                "\n  reason:   " + GetParam().reason),
            std::string::npos)
      << outcome.errors;
  EXPECT_NE(outcome.errors.find("\n  try:      "), std::string::npos) << outcome.errors;
}

TEST_P(BrokenPluginTest, IsNotTakenIntoUse) {
  const std::string name = GetParam().name;
  Install(name);
  testsupport::ConfigureProvider("ctlscript");
  EXPECT_EQ(Velmorctl({"provider", "use", name}).exitCode, 9);
  EXPECT_EQ(ReadFile(PROVIDER_CONF), "provider = \"ctlscript\"\n");
}

TEST_P(BrokenPluginTest, IsListedWithItsProblem) {
  const std::string name = GetParam().name;
  Install(name);
  const nlohmann::json listed = Listed(name);
  if (name == "missing") {
    EXPECT_TRUE(listed.is_null());
    return;
  }
  EXPECT_EQ(listed["usable"], false);
  EXPECT_EQ(listed["problem"].get<std::string>().rfind(GetParam().reason, 0), 0U) << listed;
  EXPECT_EQ(Listed("ctlscript")["usable"], true);
}

INSTANTIATE_TEST_SUITE_P(
    Each, BrokenPluginTest,
    ::testing::Values(BrokenPlugin{"missing", "it does not exist"}, BrokenPlugin{"empty", "it is empty"},
                      BrokenPlugin{"text", "it is not a shared object"},
                      BrokenPlugin{"short", "it is cut off: it has 20 bytes of at least 64"},
                      BrokenPlugin{"truncated", "it is cut off: it has 5000 bytes of at least "},
                      BrokenPlugin{"no_metadata", "it lacks the symbol ActiveDirectoryClientMetadata"},
                      BrokenPlugin{"no_operations", "it lacks the symbol ActiveDirectoryClientOperations"},
                      BrokenPlugin{"no_symbols", "it lacks the symbol ActiveDirectoryClientMetadata"},
                      BrokenPlugin{"version4", "its interface version 4 is newer than the library's, 3"},
                      BrokenPlugin{"bad_names", "it names no PAM module or no name-service module"}),
    [](const auto& test) { return test.param.name; });

/// Plug-ins that do harm when they are loaded; the command looks at them before it loads them.
class HarmfulPluginTest : public ProviderTest, public ::testing::WithParamInterface<BrokenPlugin> {};

TEST_P(HarmfulPluginTest, DoesNotHurtTheList) {
  const std::string name = GetParam().name;
  testsupport::CopyFile(std::string(VELMORCTL_BAD_PLUGIN_FOLDER "/lib") + name + ".so",
                        testsupport::InstalledPlugin(name));
  const nlohmann::json list = List();
  const nlohmann::json listed = Entry(list, name);
  EXPECT_EQ(listed["usable"], false);
  EXPECT_EQ(listed["problem"].get<std::string>().rfind(GetParam().reason, 0), 0U) << listed;
  EXPECT_EQ(Entry(list, "ctlscript")["usable"], true);
}

INSTANTIATE_TEST_SUITE_P(Each, HarmfulPluginTest,
                         ::testing::Values(BrokenPlugin{"bad_crash", "loading it crashes: "},
                                           BrokenPlugin{"bad_exit", "loading it ends the process"},
                                           BrokenPlugin{"bad_hang", "loading it does not end"}),
                         [](const auto& test) { return test.param.name; });

class MissingOperationTest : public PreparedHost {
 protected:
  MissingOperationTest() {
    testsupport::InstallPlugin("null_slots");
    testsupport::ConfigureProvider("null_slots");
  }
};

TEST_F(MissingOperationTest, IsNineAndNamesPluginAndOperations) {
  const Outcome outcome = Velmorctl(Join());
  EXPECT_EQ(outcome.exitCode, 9);
  EXPECT_NE(
      outcome.errors.find("provider: null_slots\n  file:     " + testsupport::InstalledPlugin("null_slots")),
      std::string::npos)
      << outcome.errors;
  EXPECT_NE(outcome.errors.find("joinDomain"), std::string::npos) << outcome.errors;
}

TEST_F(MissingOperationTest, IsNineForPreferredDomainControllers) {
  const Outcome outcome = Velmorctl({"dc", "prefer", "dc1"});
  EXPECT_EQ(outcome.exitCode, 9);
  EXPECT_NE(outcome.errors.find("cannot set preferred domain controllers"), std::string::npos)
      << outcome.errors;
}

TEST_F(MissingOperationTest, LeavesTheStatusUsable) {
  EXPECT_EQ(Velmorctl({"status"}).exitCode, 3);
}

class OptionTest : public PreparedHost {};

const std::string VERIFY = "UserVars.ActiveDirectoryVerifyCAMCertificate";

TEST_F(OptionTest, HasTheDefaultOnAFreshHost) {
  EXPECT_EQ(Velmorctl({"option", "get", VERIFY}).output, "1\n");
  EXPECT_EQ(Velmorctl({"option", "get", VERIFY, "--json"}).Json(),
            (nlohmann::json{{"schema", "velmor.options/1"},
                            {"options", {{{"name", VERIFY}, {"type", "integer"}, {"value", 1}}}}}));
}

TEST_F(OptionTest, IsWhatWasSet) {
  EXPECT_EQ(Velmorctl({"option", "set", VERIFY, "0"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"option", "get", VERIFY}).output, "0\n");
}

TEST_F(OptionTest, ListsAllOptions) {
  EXPECT_NE(Velmorctl({"option", "get"}).output.find(VERIFY + "  1\n"), std::string::npos);
}

TEST_F(OptionTest, KeepsAnIntegersType) {
  EXPECT_EQ(Velmorctl({"option", "set", VERIFY, "yes"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"option", "get", VERIFY}).output, "1\n");
}

TEST_F(OptionTest, ChangesTheTypeWhenItIsToldSo) {
  EXPECT_EQ(Velmorctl({"option", "set", "--text", VERIFY, "yes"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"option", "get", VERIFY, "--json"}).Json()["options"][0]["type"], "text");
}

TEST_F(OptionTest, KeepsATextsType) {
  EXPECT_EQ(Velmorctl({"option", "set", "Branch.option", "word"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"option", "set", "Branch.option", "7"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"option", "get", "Branch.option", "--json"}).Json()["options"][0]["value"], "7");
}

TEST_F(OptionTest, TakesANegativeInteger) {
  EXPECT_EQ(Velmorctl({"option", "set", "--", "Branch.option", "-5"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"option", "get", "Branch.option", "--json"}).Json()["options"][0]["value"], -5);
}

TEST_F(OptionTest, IsElevenWhenThereIsNone) {
  EXPECT_EQ(Velmorctl({"option", "get", "No.such"}).exitCode, 11);
}

TEST_F(OptionTest, RefusesANameThatIsNone) {
  EXPECT_EQ(Velmorctl({"option", "set", "no name", "1"}).exitCode, 11);
}

TEST_F(OptionTest, NamesFileAndLineOfABrokenFile) {
  WriteFile("/etc/quenix/options.conf", "UserVars.A = 1\nnonsense\n");
  const Outcome outcome = Velmorctl({"option", "get"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("/etc/quenix/options.conf"), std::string::npos) << outcome.errors;
  EXPECT_NE(outcome.errors.find("2"), std::string::npos) << outcome.errors;
}

}  // namespace

}  // namespace velmorctltest
