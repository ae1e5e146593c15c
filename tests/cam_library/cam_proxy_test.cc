#include "providers/cam_proxy.h"

#include <gtest/gtest.h>

#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"
#include "cam_library/scripted_cam_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"

using namespace quenix::authentication;
using namespace testsupport;

namespace {

CAMProxy OpenScripted(bool verify = false, const std::string& thumbprint = "") {
  return CAMProxy("scripted_cam", "10.0.0.1", verify, thumbprint);
}

/// What `action` throws when every operation returns `status`.
template <class Action>
void WithStatus(std::uint32_t status, Action action) {
  CamScript& script = UseScriptedCamPlugin();
  script.getDomainInfo = [status](auto...) { return status; };
  script.createMachineAccount = [status](auto...) { return status; };
  action(OpenScripted());
}

}  // namespace

TEST(CAMProxyTest, MissingPluginIsAnIOErrorWithTheTextAboutTheSecondPlace) {
  EXPECT_THROW_WHAT(
      CAMProxy("absent", "10.0.0.1", false, ""), IOError,
      "Unable to open CAM provider: /usr/libexec/velmor/libabsent.so: cannot open shared object "
      "file: No such file or directory");
}

TEST(CAMProxyTest, PluginOnlyInThePluginFolderIsLoadedFromThere) {
  UseScriptedCamPlugin();
  EXPECT_EQ(OpenScripted().GetDNSDomainName(), "corp.example");
}

TEST(CAMProxyTest, PluginInLib64ComesBeforeTheOneInThePluginFolder) {
  UseScriptedCamPlugin();
  InstallCamPlugin("no_cam_symbol");
  MakeFolders(PLUGIN_FOLDER + "lib64");
  CopyFile(PLUGIN_FOLDER + "libscripted_cam.so", PLUGIN_FOLDER + "lib64/libno_cam_symbol.so");
  EXPECT_NO_THROW(CAMProxy("no_cam_symbol", "10.0.0.1", false, ""));
}

TEST(CAMProxyTest, MissingSymbolNamesProviderAndLoaderText) {
  InstallCamPlugin("no_cam_symbol");
  EXPECT_THROW_WHAT(CAMProxy("no_cam_symbol", "10.0.0.1", false, ""), InvalidCAMProxyProviderException,
                    "The specified CAMProxy provider 'no_cam_symbol' is invalid: "
                    "/usr/libexec/velmor/libno_cam_symbol.so: undefined symbol: CAMProxyClientOperations");
}

TEST(CAMProxyTest, EachOfTheThreeRequiredOperationsMustBeThere) {
  for (const char* name : {"without_domain_info", "without_create", "without_release"}) {
    InstallCamPlugin(name);
    EXPECT_THROW_WHAT(CAMProxy(name, "10.0.0.1", false, ""), InvalidCAMProxyProviderException,
                      std::string("The specified CAMProxy provider '") + name + "' is invalid: ");
  }
}

TEST(CAMProxyTest, EachSingleValueIsARequestOfItsOwn) {
  const CamScript& script = UseScriptedCamPlugin();
  const CAMProxy proxy = OpenScripted();
  EXPECT_EQ(proxy.GetNetBIOSDomainName(), "CORP");
  EXPECT_EQ(proxy.GetDNSDomainName(), "corp.example");
  EXPECT_EQ(proxy.GetDomainSID(), "S-1-5-21-1-2-3");
  EXPECT_EQ(script.domainRequests, 3);
}

TEST(CAMProxyTest, ServerFlagAndThumbprintReachThePlugin) {
  CamScript& script = UseScriptedCamPlugin();
  std::string seen;
  script.getDomainInfo = [&seen](const char* server, int verify, const char* thumbprint, auto...) {
    seen = std::string(server) + " " + std::to_string(verify) + " " + thumbprint;
    return 0U;
  };
  OpenScripted(true, "AA:BB").GetDomainSID();
  EXPECT_EQ(seen, "10.0.0.1 1 AA:BB");
}

TEST(CAMProxyTest, OutParametersAreNullBeforeTheCall) {
  CamScript& script = UseScriptedCamPlugin();
  bool allNull = false;
  script.getDomainInfo = [&allNull](const char*, int, const char*, char** netbios, char** dns, char** sid) {
    allNull = *netbios == nullptr && *dns == nullptr && *sid == nullptr;
    return 0U;
  };
  OpenScripted().GetDomainSID();
  EXPECT_TRUE(allNull);
}

TEST(CAMProxyTest, NullResultsBecomeEmptyAndAreNotReleased) {
  CamScript& script = UseScriptedCamPlugin();
  script.getDomainInfo = [](auto...) { return 0U; };
  EXPECT_EQ(OpenScripted().GetDNSDomainName(), "");
  EXPECT_TRUE(script.released.empty());
}

TEST(CAMProxyTest, EachResultIsReleasedOnce) {
  CamScript& script = UseScriptedCamPlugin();
  OpenScripted().GetDomainSID();
  std::sort(script.released.begin(), script.released.end());
  EXPECT_EQ(script.released, (std::vector<std::string>{"CORP", "S-1-5-21-1-2-3", "corp.example"}));
}

TEST(CAMProxyTest, NothingIsReleasedWhenTheCallFails) {
  CamScript& script = UseScriptedCamPlugin();
  static char text[] = "not ours to release";
  script.getDomainInfo = [](const char*, int, const char*, char** netbios, char**, char**) {
    *netbios = text;
    return 5U;
  };
  EXPECT_THROW(OpenScripted().GetDomainSID(), UnknownException);
  EXPECT_TRUE(script.released.empty());
}

TEST(CAMProxyTest, ContainerAndControllerAreEmptyWithoutAskingThePlugin) {
  const CamScript& script = UseScriptedCamPlugin();
  const CAMProxy proxy = OpenScripted();
  EXPECT_EQ(proxy.GetDefaultComputerContainer(), "");
  EXPECT_EQ(proxy.GetDomainController(), "");
  EXPECT_EQ(script.domainRequests + script.creations, 0);
}

TEST(CAMProxyTest, EmptyContainerReachesThePluginAsNull) {
  CamScript& script = UseScriptedCamPlugin();
  bool null = false;
  script.createMachineAccount = [&null](const char*, const char*, const char* container, auto...) {
    null = container == nullptr;
    return 0U;
  };
  OpenScripted().CreateMachineAccount("host1.corp.example", "");
  EXPECT_TRUE(null);
}

TEST(CAMProxyTest, CreationFillsTheSecondAndThirdField) {
  UseScriptedCamPlugin();
  const ComputerPrincipalInfo principal =
      OpenScripted().CreateMachineAccount("host1.corp.example", "OU=Hosts");
  EXPECT_EQ(principal.organizationalUnit, "");
  EXPECT_EQ(principal.accountName, "HOST1$");
  EXPECT_EQ(principal.joinBlob, "blob");
}

TEST(CAMProxyTest, BothResultsOfACreationAreReleasedOnce) {
  CamScript& script = UseScriptedCamPlugin();
  OpenScripted().CreateMachineAccount("host1.corp.example", "OU=Hosts");
  std::sort(script.released.begin(), script.released.end());
  EXPECT_EQ(script.released, (std::vector<std::string>{"HOST1$", "blob"}));
}

TEST(CAMProxyTest, WrongCertificateHasAClassOfItsOwnFromBothOperations) {
  WithStatus(0x80090325, [](const CAMProxy& proxy) {
    EXPECT_THROW_WHAT(proxy.GetDomainSID(), InvalidCAMCertificateException,
                      "The CAM server's certificate cannot be verified.");
    EXPECT_THROW_WHAT(proxy.CreateMachineAccount("a", "b"), InvalidCAMCertificateException,
                      "The CAM server's certificate cannot be verified.");
  });
}

TEST(CAMProxyTest, TimedOutIsAClassOfItsOwn) {
  WithStatus(10060, [](const CAMProxy& proxy) { EXPECT_THROW(proxy.GetDomainSID(), WSATimedOutException); });
}

TEST(CAMProxyTest, NoRouteIsAClassOfItsOwn) {
  WithStatus(1229,
             [](const CAMProxy& proxy) { EXPECT_THROW(proxy.GetDomainSID(), ConnectionInvalidException); });
}

TEST(CAMProxyTest, RefusedIsAClassOfItsOwn) {
  WithStatus(1225,
             [](const CAMProxy& proxy) { EXPECT_THROW(proxy.GetDomainSID(), ConnectionRefusedException); });
}

TEST(CAMProxyTest, OutOfMemoryIsAClassOfItsOwn) {
  WithStatus(8, [](const CAMProxy& proxy) { EXPECT_THROW(proxy.GetDomainSID(), NotEnoughMemoryException); });
}

TEST(CAMProxyTest, OtherStatusesAreUnknownAndCarryTheirCodeEvenWhenTheProviderMappingHasAClass) {
  WithStatus(5, [](const CAMProxy& proxy) {
    EXPECT_THROW_WHAT(proxy.CreateMachineAccount("a", "b"), UnknownException,
                      "Exception 0x00000005: Unknown exception");
  });
}

TEST(CAMProxyTest, PluginIsUnloadedWithTheProxy) {
  InstallCamPlugin("scripted_cam");
  const auto isMapped = [] {
    return ReadFile("/proc/self/maps").find("libscripted_cam.so") != std::string::npos;
  };
  {
    const CAMProxy proxy = OpenScripted();
    EXPECT_TRUE(isMapped());
  }
  EXPECT_FALSE(isMapped());
}

TEST(CAMProxyTest, PluginThatIsRefusedIsUnloaded) {
  InstallCamPlugin("without_release");
  EXPECT_THROW(CAMProxy("without_release", "10.0.0.1", false, ""), InvalidCAMProxyProviderException);
  EXPECT_EQ(ReadFile("/proc/self/maps").find("libwithout_release.so"), std::string::npos);
}
