#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstring>
#include <stdexcept>
#include <vector>

#include "authentication/authentication.h"
#include "cam_library/scripted_cam_plugin.h"
#include "hostmgmt/host.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "support/machine.h"

using namespace quenix::authentication;
using namespace testsupport;

namespace {

constexpr const char* server = "10.0.0.1";
constexpr const char* optionPath = "UserVars.ActiveDirectoryVerifyCAMCertificate";
constexpr const char* database = "/var/lib/quenix/configstore.db";

/// Makes every step fail that comes before a server is asked.
class NothingCanBeRead {
 public:
  NothingCanBeRead() {
    WriteFile("/etc/quenix/options.conf", "this is no option\n");
    RemoveFile(CAMPROVIDER_CONF);
  }

 private:
  TakeOver<int(char*, std::size_t)> hostName_{calls::gethostname, [](auto...) { return -1; }};
};

/// A host "host1" that resolves to host1.corp.example, with both plug-ins.
class CAMJoinTest : public testing::Test {
 protected:
  CAMJoinTest() {
    SetHostName("host1");
    WriteFile("/etc/hosts", "10.0.0.5 host1.corp.example host1\n");
    WriteFile("/etc/nsswitch.conf", "hosts: files\n");
    WriteFile("/etc/resolv.conf", "");
    AddInterface("management", "10.0.0.5");
    VerifyCertificate(0);
  }

  static void VerifyCertificate(int value) {
    HostMgmt::HostFactory::GetHost()->SetIntegerOption(optionPath, value);
  }

  static void BreakConfigurationStore() { WriteFile(database, "no database"); }

  void Join(const std::string& container = "", bool skipHostnameCheck = true) {
    ActiveDirectoryStore(1).JoinDomainWithCAM(server, container, skipHostnameCheck);
  }

  Script& provider_ = UseScriptedPlugin();
  CamScript& cam_ = UseScriptedCamPlugin();
};

std::vector<std::string> ErrorsLogged() {
  std::vector<std::string> texts;
  for (const LogLine& line : RecordedLog()) {
    if (line.priority == LOG_ERR) texts.push_back(line.text);
  }
  return texts;
}

}  // namespace

TEST_F(CAMJoinTest, HostNameInsteadOfAnAddressIsRefusedBeforeAnythingIsRead) {
  ActiveDirectoryStore store(1);
  const NothingCanBeRead obstacle;
  EXPECT_THROW_WHAT(
      store.JoinDomainWithCAM("cam.corp.example", "", true), InvalidIPAddressException,
      "The IP Address is invalid: IPv4 address 'cam.corp.example' cannot be parsed as an IP address");
}

TEST_F(CAMJoinTest, Ipv6AddressIsRefusedBeforeAnythingIsRead) {
  ActiveDirectoryStore store(1);
  const NothingCanBeRead obstacle;
  EXPECT_THROW(store.JoinDomainWithCAM("::1", "", true), InvalidIPAddressException);
}

TEST_F(CAMJoinTest, DiscoveryTakesNoHostNameAndNoIpv6Address) {
  ActiveDirectoryStore store(1);
  const NothingCanBeRead obstacle;
  EXPECT_THROW(store.GetDomainForCAMService("cam.corp.example"), InvalidIPAddressException);
  EXPECT_THROW(store.GetDomainForCAMService("::1"), InvalidIPAddressException);
}

TEST_F(CAMJoinTest, OptionOfTwoIsInvalidEvenIfTheServerAnswers) {
  VerifyCertificate(2);
  EXPECT_THROW_WHAT(Join(), InvalidVerifyCAMCertificateOptionException,
                    "The VerifyCAMCertificate option is invalid: Invalid value for "
                    "UserVars.ActiveDirectoryVerifyCAMCertificate");
  EXPECT_EQ(cam_.domainRequests + cam_.creations, 0);
}

TEST_F(CAMJoinTest, OptionOfAnotherTypeCannotBeHad) {
  HostMgmt::HostFactory::GetHost()->SetStringOption(optionPath, "yes");
  EXPECT_THROW_WHAT(Join(), InvalidVerifyCAMCertificateOptionException,
                    "The VerifyCAMCertificate option is invalid: Unable to get advanced option "
                    "UserVars.ActiveDirectoryVerifyCAMCertificate");
}

TEST_F(CAMJoinTest, UnreadableOptionsCannotBeHad) {
  WriteFile("/etc/quenix/options.conf", "this is no option\n");
  EXPECT_THROW_WHAT(Join(), InvalidVerifyCAMCertificateOptionException,
                    "The VerifyCAMCertificate option is invalid: Unable to get advanced option "
                    "UserVars.ActiveDirectoryVerifyCAMCertificate");
}

TEST_F(CAMJoinTest, OptionIsReadBeforeTheHostName) {
  VerifyCertificate(2);
  TakeOver<int(char*, std::size_t)> fail(calls::gethostname, [](auto...) { return -1; });
  EXPECT_THROW(Join(), InvalidVerifyCAMCertificateOptionException);
}

TEST_F(CAMJoinTest, HostNameIsAskedForBeforeTheProviderIsLookedUp) {
  RemoveFile(CAMPROVIDER_CONF);
  TakeOver<int(char*, std::size_t)> fail(calls::gethostname, [](auto...) { return -1; });
  EXPECT_THROW_WHAT(Join(), InvalidHostNameException,
                    "The current hostname is invalid: unable to get hostname");
}

TEST_F(CAMJoinTest, MissingProviderConfigurationMeansNoneInstalled) {
  RemoveFile(CAMPROVIDER_CONF);
  EXPECT_THROW_WHAT(Join(), InvalidCAMProxyProviderException,
                    "The specified CAMProxy provider '(none installed)' is invalid");
}

TEST_F(CAMJoinTest, EmptyProviderMeansUnset) {
  ConfigureCamProvider("");
  EXPECT_THROW_WHAT(Join(), InvalidCAMProxyProviderException,
                    "The specified CAMProxy provider '(unset)' is invalid");
}

TEST_F(CAMJoinTest, AbsentProviderKeyMeansUnset) {
  WriteFile(CAMPROVIDER_CONF, "other = \"x\"\n");
  ActiveDirectoryStore store(1);
  EXPECT_THROW_WHAT(store.GetDomainForCAMService(server), InvalidCAMProxyProviderException,
                    "The specified CAMProxy provider '(unset)' is invalid");
}

TEST_F(CAMJoinTest, DiscoveryNeverVerifiesTheCertificate) {
  VerifyCertificate(1);
  int verify = -1;
  std::string thumbprint = "unset";
  const auto answer = cam_.getDomainInfo;
  cam_.getDomainInfo = [&](const char* address, int flag, const char* print, auto... results) {
    verify = flag;
    thumbprint = print;
    return answer(address, flag, print, results...);
  };
  EXPECT_EQ(ActiveDirectoryStore(1).GetDomainForCAMService(server), "corp.example");
  EXPECT_EQ(verify, 0);
  EXPECT_EQ(thumbprint, "");
}

TEST_F(CAMJoinTest, WithTheOptionAtZeroNoThumbprintIsReadEvenIfTheStoreCannotBe) {
  BreakConfigurationStore();
  EXPECT_THROW(Join(), OrvConfigStore::ConfigStoreException);  // from the recording, at the very end
  EXPECT_EQ(cam_.creations, 1);
}

TEST_F(CAMJoinTest, StoredThumbprintReachesThePlugin) {
  VerifyCertificate(1);
  ActiveDirectoryConfigStore().StoreAuthProxyCertInfo("AA:BB", "certificate");
  std::string seen;
  cam_.createMachineAccount = [&seen](const char*, const char*, const char*, int verify,
                                      const char* thumbprint, auto...) {
    seen = std::to_string(verify) + " " + thumbprint;
    return 0U;
  };
  Join();
  EXPECT_EQ(seen, "1 AA:BB");
}

TEST_F(CAMJoinTest, MissingThumbprintIsLoggedAndNamesItsRecord) {
  VerifyCertificate(1);
  EXPECT_THROW_WHAT(Join(), InvalidThumbprintStoreException,
                    "The specified thumbprint store 'auth_proxy_certificate' is invalid");
  EXPECT_EQ(ErrorsLogged(),
            std::vector<std::string>{"Unable to fetch thumbprint from Config Store: Failed to "
                                     "get the requested object"});
}

TEST_F(CAMJoinTest, ProviderIsLookedUpBeforeTheThumbprint) {
  VerifyCertificate(1);
  RemoveFile(CAMPROVIDER_CONF);
  EXPECT_THROW(Join(), InvalidCAMProxyProviderException);
  EXPECT_EQ(ErrorsLogged(), std::vector<std::string>{});
}

TEST_F(CAMJoinTest, MissingPluginIsAnIOError) {
  ConfigureCamProvider("absent");
  EXPECT_THROW(Join(), IOError);
}

TEST_F(CAMJoinTest, SkippedHostNameCheckAsksTheServerOnceLess) {
  Join("", true);
  EXPECT_EQ(cam_.domainRequests, 3);
  Join("", false);
  EXPECT_EQ(cam_.domainRequests, 7);
}

TEST_F(CAMJoinTest, FailedHostNameCheckCreatesNoAccount) {
  SetHostName("localhost");
  WriteFile("/etc/hosts", "127.0.0.1 localhost\n");
  EXPECT_THROW(Join("", false), InvalidHostNameException);
  EXPECT_EQ(cam_.creations, 0);
}

TEST_F(CAMJoinTest, SkippedHostNameCheckTakesAnyName) {
  SetHostName("localhost");
  WriteFile("/etc/hosts", "127.0.0.1 localhost\n");
  EXPECT_NO_THROW(Join("", true));
}

TEST_F(CAMJoinTest, AccountIsAskedForWithTheFullNameAndTheContainer) {
  std::string seen;
  cam_.createMachineAccount = [&seen](const char* address, const char* name, const char* container, auto...) {
    seen = std::string(address) + " " + name + " " + container;
    return 0U;
  };
  Join("OU=Hosts");
  EXPECT_EQ(seen, "10.0.0.1 host1.corp.example OU=Hosts");
}

TEST_F(CAMJoinTest, EmptyContainerReachesThePluginAsNullAndIsNotStored) {
  bool null = false;
  cam_.createMachineAccount = [&null](const char*, const char*, const char* container, auto...) {
    null = container == nullptr;
    return 0U;
  };
  Join("");
  EXPECT_TRUE(null);
  EXPECT_EQ(ActiveDirectoryConfigStore().GetOrganizationalUnit(), "");
}

TEST_F(CAMJoinTest, ProviderGetsBothRecordsInTheOrderOfTheirFields) {
  std::vector<std::string> seen;
  provider_.joinDomainWithMachineAccount = [&seen](const auto* domain, const auto* account) {
    for (const char* text : {domain->domainController, domain->netbiosDomainName, domain->dnsDomainName,
                             domain->domainSid, account->hostName, account->dnsDomainName,
                             account->organizationalUnit, account->accountName, account->joinBlob}) {
      seen.emplace_back(text);
    }
    return 0U;
  };
  Join("OU=Hosts");
  EXPECT_EQ(seen, (std::vector<std::string>{"", "CORP", "corp.example", "S-1-5-21-1-2-3", "host1",
                                            "corp.example", "", "HOST1$", "blob"}));
}

TEST_F(CAMJoinTest, HostNameIsCutAtItsFirstDot) {
  SetHostName("host1.corp.example");
  std::string seen;
  provider_.joinDomainWithMachineAccount = [&seen](const auto*, const auto* account) {
    seen = account->hostName;
    return 0U;
  };
  Join();
  EXPECT_EQ(seen, "host1");
}

TEST_F(CAMJoinTest, ServerIsAskedForTheDomainAfterTheAccountWasCreated) {
  std::string order;
  const auto domain = cam_.getDomainInfo;
  const auto create = cam_.createMachineAccount;
  cam_.getDomainInfo = [&](auto... arguments) {
    order += "domain ";
    return domain(arguments...);
  };
  cam_.createMachineAccount = [&](auto... arguments) {
    order += "create ";
    return create(arguments...);
  };
  Join();
  EXPECT_EQ(order, "create domain domain domain ");
}

TEST_F(CAMJoinTest, JoinIsRecordedWithDomainContainerAndServer) {
  Join("OU=Hosts");
  ActiveDirectoryConfigStore records;
  EXPECT_EQ(records.GetDomainName(), "corp.example");
  EXPECT_EQ(records.GetOrganizationalUnit(), "OU=Hosts");
  EXPECT_EQ(records.GetAuthProxyAddr(), server);
}

TEST_F(CAMJoinTest, FailedJoinIsNotRecorded) {
  provider_.joinDomainWithMachineAccount = [](auto...) { return 5U; };
  EXPECT_THROW(Join(), AccessDeniedException);
  EXPECT_THROW(ActiveDirectoryConfigStore().GetDomainName(), ConfigurationError);
}

TEST_F(CAMJoinTest, PluginIsClosedWhenTheJoinFails) {
  provider_.joinDomainWithMachineAccount = [](auto...) { return 5U; };
  ActiveDirectoryStore store(1);
  int closed = 0;
  const TakeOver<int(void*)> watch(calls::dlclose, [&closed](void* handle) {
    ++closed;
    return calls::dlclose.Real(handle);
  });
  EXPECT_THROW(store.JoinDomainWithCAM(server, "", true), AccessDeniedException);
  EXPECT_EQ(closed, 1);
}

TEST_F(CAMJoinTest, UnrecordedJoinIsLoggedAndUndoneAndTheStoresExceptionGoesOut) {
  BreakConfigurationStore();
  int leaves = 0;
  bool withoutAccount = false;
  provider_.partDomain = [&](const Credentials* credentials) {
    ++leaves;
    withoutAccount = credentials == nullptr;
    return 0U;
  };
  std::string text;
  try {
    Join();
    ADD_FAILURE() << "nothing was thrown";
  } catch (const OrvConfigStore::ConfigStoreException& failure) {
    text = failure.what();
  }
  EXPECT_EQ(leaves, 1);
  EXPECT_TRUE(withoutAccount);
  EXPECT_EQ(ErrorsLogged(), std::vector<std::string>{"Failed to store domain details to Config Store: " +
                                                     text + ".Leaving Domain..."});
}

TEST_F(CAMJoinTest, ExceptionOfAnyOtherClassUndoesTheJoinToo) {
  int leaves = 0;
  provider_.partDomain = [&leaves](auto...) {
    ++leaves;
    return 0U;
  };
  const TakeOver<int(int)> fail(calls::fsync, [](int) -> int { throw std::runtime_error("no disk"); });
  EXPECT_THROW_WHAT(Join(), std::runtime_error, "no disk");
  EXPECT_EQ(leaves, 1);
}

TEST_F(CAMJoinTest, ExceptionOfTheLeaveGoesOutInstead) {
  BreakConfigurationStore();
  provider_.partDomain = [](auto...) { return 1225U; };
  EXPECT_THROW(Join(), ConnectionRefusedException);
}
