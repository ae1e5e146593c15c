/// The loaded CAM proxy plug-in.
#ifndef PROVIDERS_CAM_PROXY_H
#define PROVIDERS_CAM_PROXY_H

#include <string>

#include "authentication/directory_records.h"
#include "authentication/plugin/cam_proxy_client.h"
#include "providers/plugin_library.h"

namespace quenix::authentication {

/// Asks one CAM server through a plug-in. For one thread; every operation that asks the server makes a
/// request of its own, lasts as long as the plug-in takes, and throws the exception of its status when it
/// fails.
class CAMProxy {
 public:
  /// Loads the plug-in of that name. Throws IOError when it cannot be loaded, and
  /// InvalidCAMProxyProviderException when it lacks its symbol or one of its operations.
  CAMProxy(const std::string& provider, const std::string& server, bool verifyCertificate,
           const std::string& thumbprint);
  CAMProxy(const CAMProxy&) = delete;
  CAMProxy& operator=(const CAMProxy&) = delete;

  /// Unloads the plug-in.
  ~CAMProxy();

  void GetDomainInfo(std::string& netbiosName, std::string& dnsName, std::string& domainSid) const;
  std::string GetNetBIOSDomainName() const;
  std::string GetDNSDomainName() const;
  std::string GetDomainSID() const;

  /// Both are empty: the service decides. The plug-in is not asked.
  std::string GetDefaultComputerContainer() const;
  std::string GetDomainController() const;

  /// Creates the computer account for `hostName` in `container`; an empty one leaves the choice to the
  /// service. The result holds a secret.
  ComputerPrincipalInfo CreateMachineAccount(const std::string& hostName, const std::string& container) const;

 private:
  PluginLibrary library_;
  const struct CAMProxyClientOperations* operations_;
  bool verifyCertificate_;
  std::string server_;
  std::string thumbprint_;
};

}  // namespace quenix::authentication

#endif  // PROVIDERS_CAM_PROXY_H
