// The store "Active Directory": construction, activation and the operations that go straight to the plug-in.

#include "authentication/active_directory_store.h"

#include <gtest/gtest.h>
#include <syslog.h>

#include <deque>
#include <string>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "support/machine.h"

namespace quenix::authentication {
namespace {

using testsupport::Answer;
using testsupport::AUTHENTICATION_CONF;
using testsupport::ConfigureProvider;
using testsupport::InstalledPlugin;
using testsupport::InstallPlugin;
using testsupport::ListOf;
using testsupport::LogLine;
using testsupport::PROVIDER_CONF;
using testsupport::ReadFile;
using testsupport::RecordedLog;
using testsupport::WriteFile;

using Lines = std::vector<LogLine>;
using Names = std::vector<std::string>;

std::string Invalid(const std::string& name) {
  return "The specified Active Directory provider '" + name + "' is invalid";
}

TEST(ActiveDirectoryStoreConstructionTest, WithoutAConfigurationNoneIsInstalled) {
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException,
                    Invalid("(none installed)"));
}

TEST(ActiveDirectoryStoreConstructionTest, WithAnUnreadableConfigurationNoneIsInstalled) {
  ConfigureProvider("version3");
  testsupport::SetMode(PROVIDER_CONF, 0);
  const testsupport::WithoutFilePowers powers;
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException,
                    Invalid("(none installed)"));
}

TEST(ActiveDirectoryStoreConstructionTest, AnAbsentKeyIsAnUnsetProvider) {
  WriteFile(PROVIDER_CONF, "other = \"x\"\n");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("(unset)"));
}

TEST(ActiveDirectoryStoreConstructionTest, AnEmptyFileIsAnUnsetProvider) {
  WriteFile(PROVIDER_CONF, "");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("(unset)"));
}

TEST(ActiveDirectoryStoreConstructionTest, AnEmptyNameIsAnUnsetProvider) {
  ConfigureProvider("");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("(unset)"));
}

TEST(ActiveDirectoryStoreConstructionTest, AMalformedConfigurationIsReportedAsSuch) {
  WriteFile(PROVIDER_CONF, "provider\n");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), ConfigurationError,
                    "Error parsing configuration on line 1: no delimiter found");
}

TEST(ActiveDirectoryStoreConstructionTest, AMissingPluginIsNamed) {
  ConfigureProvider("missing");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("missing"));
}

TEST(ActiveDirectoryStoreConstructionTest, AFileThatIsNoSharedObjectIsNamed) {
  ConfigureProvider("text");
  WriteFile(InstalledPlugin("text"), "text");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("text"));
}

TEST(ActiveDirectoryStoreConstructionTest, ACutOffPluginIsNamed) {
  ConfigureProvider("cut");
  WriteFile(InstalledPlugin("cut"), ReadFile(testsupport::BuiltPlugin("version3")).substr(0, 6000));
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException, Invalid("cut"));
}

TEST(ActiveDirectoryStoreConstructionTest, AnInvalidPluginKeepsItsOwnReason) {
  ConfigureProvider("version4");
  InstallPlugin("version4");
  EXPECT_THROW_WHAT(
      ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException,
      Invalid("version4") + ": The API version (4) is not supported by this version of libvelmor");
}

TEST(ActiveDirectoryStoreConstructionTest, APluginWithoutSymbolsKeepsItsOwnReason) {
  ConfigureProvider("no_symbols");
  InstallPlugin("no_symbols");
  EXPECT_THROW_WHAT(ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException,
                    Invalid("no_symbols") + ": " + InstalledPlugin("no_symbols") +
                        ": undefined symbol: ActiveDirectoryClientMetadata");
}

class ActiveDirectoryStoreTest : public ::testing::Test {
 protected:
  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  ActiveDirectoryStore store_{60};
};

TEST_F(ActiveDirectoryStoreTest, IsCalledActiveDirectory) {
  EXPECT_EQ(store_.GetDisplayName(), "Active Directory");
}

TEST_F(ActiveDirectoryStoreTest, ActivatingRecordsItAndThenRefreshesTheCache) {
  WriteFile(AUTHENTICATION_CONF, "remote-authentication-store = \"None\"\n");
  std::string record;
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    record = ReadFile(AUTHENTICATION_CONF);
    return Answer(domain, release, {"", ""});
  };
  store_.MakeActive();
  EXPECT_EQ(record, "remote-authentication-store = \"Active Directory\"\n");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), record);
  EXPECT_TRUE(store_.IsActive());
}

TEST_F(ActiveDirectoryStoreTest, ActivatingWritesEvenIfItIsActiveAlready) {
  WriteFile(AUTHENTICATION_CONF, "\nremote-authentication-store = 'Active Directory'\n");
  store_.MakeActive();
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "remote-authentication-store = \"Active Directory\"\n");
}

TEST_F(ActiveDirectoryStoreTest, ActivatingOnAFileWithoutTheKeyIsAnError) {
  WriteFile(AUTHENTICATION_CONF, "other = \"x\"\n");
  EXPECT_THROW_WHAT(store_.MakeActive(), InvalidKeyException,
                    "The specified key 'remote-authentication-store' was not found in this configuration");
  EXPECT_EQ(ReadFile(AUTHENTICATION_CONF), "other = \"x\"\n");
}

TEST_F(ActiveDirectoryStoreTest, ActivatingWithoutTheFileIsAnError) {
  EXPECT_THROW_WHAT(store_.MakeActive(), IOError,
                    "Unable to open '/etc/quenix/velmor/authentication.conf': No such file or directory");
}

TEST_F(ActiveDirectoryStoreTest, DeactivatingRefreshesTheCacheAndWritesNothing) {
  bool asked = false;
  script_.getActiveDomain = [&](auto* domain, auto* release) {
    asked = true;
    return Answer(domain, release, {"", ""});
  };
  store_.MakeInactive();
  EXPECT_TRUE(asked);
  EXPECT_FALSE(testsupport::Exists(AUTHENTICATION_CONF));
}

TEST_F(ActiveDirectoryStoreTest, TheDomainControllerIsAskedForWithoutQualifier) {
  const char* qualifier = "";
  std::string domain;
  script_.getAnyDomainController = [&](const char* q, const char* d, char** text, auto* release) {
    qualifier = q;
    domain = d;
    return Answer(text, release, "dc1.example.test");
  };
  EXPECT_EQ(store_.GetDomainControllerForDomain("example.test"), "dc1.example.test");
  EXPECT_EQ(qualifier, nullptr);
  EXPECT_EQ(domain, "example.test");
}

TEST_F(ActiveDirectoryStoreTest, TheHostPrincipalIsThePlugins) {
  script_.getHostPrincipalForDomain = [](const char* domain, char** text, auto* release) {
    return Answer(text, release, std::string("HOST$@") + domain);
  };
  EXPECT_EQ(store_.GetHostPrincipalForDomain("EXAMPLE.TEST"), "HOST$@EXAMPLE.TEST");
}

TEST_F(ActiveDirectoryStoreTest, TheCanonicalUserNameIsThePlugins) {
  script_.convertCanonicalUsername = [](const char* name, char** text, auto* release) {
    return Answer(text, release, std::string("canonical ") + name);
  };
  EXPECT_EQ(store_.ConvertCanonicalUsername("user"), "canonical user");
}

TEST_F(ActiveDirectoryStoreTest, PreferredControllersReachThePlugin) {
  Names passed;
  script_.setPreferredDomainControllers = [&](const char* const* names) {
    passed = ListOf(names);
    return 0U;
  };
  store_.SetPreferredDomainControllers({"dc2", "dc1"});
  EXPECT_EQ(passed, (Names{"dc2", "dc1"}));
  EXPECT_TRUE(RecordedLog().empty());
}

TEST_F(ActiveDirectoryStoreTest, SmartCardServicesReachThePluginAndComeBack) {
  Names passed;
  script_.setSmartCardEnabledServices = [&](const char* const* names) {
    passed = ListOf(names);
    return 0U;
  };
  script_.getSmartCardEnabledServices = [](char*** names, auto* release) {
    return Answer(names, release, Names{"login"});
  };
  store_.SetSmartCardEnabledServices({"sshd", "su"});
  EXPECT_EQ(passed, (Names{"sshd", "su"}));
  EXPECT_EQ(store_.GetSmartCardEnabledServices(), (Names{"login"}));
}

TEST_F(ActiveDirectoryStoreTest, FailuresOfThePluginArePassedOn) {
  const auto refuse = [](auto...) { return 5U; };
  script_.getAnyDomainController = refuse;
  script_.getHostPrincipalForDomain = refuse;
  script_.convertCanonicalUsername = refuse;
  script_.setPreferredDomainControllers = refuse;
  script_.getSmartCardEnabledServices = refuse;
  script_.setSmartCardEnabledServices = refuse;
  EXPECT_THROW(store_.GetDomainControllerForDomain("d"), AccessDeniedException);
  EXPECT_THROW(store_.GetHostPrincipalForDomain("d"), AccessDeniedException);
  EXPECT_THROW(store_.ConvertCanonicalUsername("n"), AccessDeniedException);
  EXPECT_THROW(store_.SetPreferredDomainControllers({}), AccessDeniedException);
  EXPECT_THROW(store_.GetSmartCardEnabledServices(), AccessDeniedException);
  EXPECT_THROW(store_.SetSmartCardEnabledServices({}), AccessDeniedException);
}

TEST_F(ActiveDirectoryStoreTest, AStatusThatSaysNotSupportedCountsAsAMissingOperation) {
  const auto lack = [](auto...) { return 120U; };
  script_.getAnyDomainController = lack;
  script_.convertCanonicalUsername = lack;
  script_.setPreferredDomainControllers = lack;
  EXPECT_EQ(store_.GetDomainControllerForDomain("d"), "");
  EXPECT_EQ(store_.ConvertCanonicalUsername("user"), "user");
  store_.SetPreferredDomainControllers({"dc"});
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING, "Setting of preferred domain controllers is not implemented."}}));
}

TEST_F(ActiveDirectoryStoreTest, LeavingWithAnAccountForwardsItAndNothingElse) {
  testsupport::MakeFolders("/var/lib/quenix");
  ActiveDirectoryConfigStore().StoreDomainInfo("example.test", "", "");
  const Credentials credentials{"u", "p"};
  const Credentials* passed = nullptr;
  script_.partDomain = [&](const Credentials* argument) {
    passed = argument;
    return 0U;
  };
  store_.PartDomain(credentials);
  EXPECT_EQ(passed, &credentials);
  EXPECT_EQ(ActiveDirectoryConfigStore().GetDomainName(), "example.test");
}

TEST_F(ActiveDirectoryStoreTest, ADestroyedStoreUnloadsItsPluginWhenNobodyElseUsesIt) {
  InstallPlugin("version3");
  ConfigureProvider("version3");
  {
    const ActiveDirectoryStore store(60);
    EXPECT_NE(ReadFile("/proc/self/maps").find("libversion3.so"), std::string::npos);
  }
  EXPECT_EQ(ReadFile("/proc/self/maps").find("libversion3.so"), std::string::npos);
}

class StoreWithoutOperationsTest : public ::testing::Test {
 protected:
  StoreWithoutOperationsTest() {
    InstallPlugin("null_slots");
    ConfigureProvider("null_slots");
    store_ = std::make_unique<ActiveDirectoryStore>(60);
  }

  std::unique_ptr<ActiveDirectoryStore> store_;
};

TEST_F(StoreWithoutOperationsTest, LookUpsHaveTheirFallbacks) {
  EXPECT_EQ(store_->GetDomainControllerForDomain("example.test"), "");
  EXPECT_EQ(store_->GetHostPrincipalForDomain("example.test"), "");
  EXPECT_EQ(store_->ConvertCanonicalUsername("DOMAIN\\user"), "DOMAIN\\user");
}

TEST_F(StoreWithoutOperationsTest, PreferringControllersOnlyWarns) {
  store_->SetPreferredDomainControllers({"dc"});
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING, "Setting of preferred domain controllers is not implemented."}}));
}

TEST_F(StoreWithoutOperationsTest, SmartCardServicesAreNotImplemented) {
  EXPECT_THROW(store_->GetSmartCardEnabledServices(), CallNotImplementedException);
  EXPECT_THROW(store_->SetSmartCardEnabledServices({}), CallNotImplementedException);
}

TEST_F(StoreWithoutOperationsTest, JoiningAndLeavingAreNotImplemented) {
  EXPECT_THROW(store_->JoinDomain("d", {"u", "p"}, true), CallNotImplementedException);
  EXPECT_THROW(store_->PartDomain(), CallNotImplementedException);
  EXPECT_THROW(store_->PartDomain({"u", "p"}), CallNotImplementedException);
}

TEST_F(StoreWithoutOperationsTest, QuestionsHaveNeutralAnswers) {
  EXPECT_TRUE(store_->GetTrustedDomains().empty());
  EXPECT_EQ(store_->GetDomainTrustState(), 0U);
  EXPECT_EQ(store_->GetDomainTrustRelationship("d"), 0U);
  const auto configuration = store_->GetStoreConfiguration();
  const auto& fields = dynamic_cast<ActiveDirectoryStoreConfiguration&>(*configuration);
  EXPECT_EQ(fields.activeDomain.dnsName, "");
  EXPECT_TRUE(fields.preferredDomainControllers.empty());
  EXPECT_EQ(fields.machineAccountDN, "");
  EXPECT_TRUE(RecordedLog().empty());
}

}  // namespace
}  // namespace quenix::authentication
