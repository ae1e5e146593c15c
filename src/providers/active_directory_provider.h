/// The loaded Active Directory provider plug-in.
#ifndef PROVIDERS_ACTIVE_DIRECTORY_PROVIDER_H
#define PROVIDERS_ACTIVE_DIRECTORY_PROVIDER_H

#include <deque>
#include <list>
#include <string>
#include <vector>

#include "authentication/directory_records.h"
#include "authentication/plugin/active_directory_client.h"
#include "providers/plugin_library.h"

namespace quenix::authentication {

/// Calls a provider plug-in with the library's own types and turns its statuses into exceptions.
///
/// Keeps the plug-in loaded as long as it lives. Nothing in it changes after construction: every operation
/// may be called from several threads at once and lasts as long as the plug-in takes. Every operation throws
/// CallNotImplementedException when the plug-in lacks it, and the exception of the status when it fails.
class ActiveDirectoryProvider {
 public:
  /// Loads the plug-in of that name. Throws IOError when it cannot be loaded, and
  /// InvalidActiveDirectoryProviderException when it lacks a symbol or was built for a later interface.
  explicit ActiveDirectoryProvider(const std::string& name);
  ActiveDirectoryProvider(const ActiveDirectoryProvider&) = delete;
  ActiveDirectoryProvider& operator=(const ActiveDirectoryProvider&) = delete;

  /// Unloads the plug-in.
  ~ActiveDirectoryProvider();

  int GetAPIVersion() const;
  const std::string& PAMModule() const { return pamModule_; }
  const std::list<std::string>& PAMModuleParameters() const { return pamModuleParameters_; }
  const std::string& NSSModule() const { return nssModule_; }
  const std::list<std::string>& NSSModuleParameters() const { return nssModuleParameters_; }

  /// Both joins make up to four attempts while the plug-in reports a failure that may cure itself, and sleep
  /// 30 seconds after each of those. *Deliberate:* also after the last one.
  void JoinDomain(const std::string& domain, const std::string& organizationalUnit,
                  const Credentials& credentials) const;
  void JoinDomainWithMachineAccount(const CAM::DirectoryDomainInfo& domain,
                                    const CAM::MachineAccountInfo& account) const;

  void PartDomain() const;
  void PartDomain(const Credentials& credentials) const;

  Domain GetActiveDomain() const;
  void SetPreferredDomainControllers(const std::deque<std::string>& controllers) const;
  std::deque<std::string> GetPreferredDomainControllers() const;
  TrustState GetDomainTrustState() const;
  std::deque<Domain> GetTrustedDomains() const;
  std::string GetMachineAccountDN() const;

  /// An empty qualifier asks for any controller.
  std::string GetAnyDomainController(const std::string& qualifier, const std::string& domain) const;
  std::string ConvertCanonicalUsername(const std::string& name) const;
  std::string GetHostPrincipalForDomain(const std::string& domain) const;
  TrustRelationship GetDomainTrustRelationship(const std::string& domain) const;
  void SetSmartCardEnabledServices(const std::vector<std::string>& services) const;
  std::vector<std::string> GetSmartCardEnabledServices() const;

 private:
  void CacheMetadata();
  void RequireVersion(int version) const;

  PluginLibrary library_;
  const struct ActiveDirectoryClientMetadata* metadata_;
  const struct ActiveDirectoryClientOperations* operations_;
  std::string pamModule_;
  std::list<std::string> pamModuleParameters_;
  std::string nssModule_;
  std::list<std::string> nssModuleParameters_;
};

}  // namespace quenix::authentication

#endif  // PROVIDERS_ACTIVE_DIRECTORY_PROVIDER_H
