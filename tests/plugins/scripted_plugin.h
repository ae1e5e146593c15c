/// Plug-ins at the real place, and one that does what the test says.
#ifndef PLUGINS_SCRIPTED_PLUGIN_H
#define PLUGINS_SCRIPTED_PLUGIN_H

#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "authentication/plugin/active_directory_client.h"

namespace testsupport {

/// The built plug-in of that name.
std::string BuiltPlugin(const std::string& name);

/// Where the library looks for the plug-in of that name.
std::string InstalledPlugin(const std::string& name);

/// Copies the built plug-in to where the library looks for it.
void InstallPlugin(const std::string& name);

/// Names the plug-in in the provider configuration.
void ConfigureProvider(const std::string& name);

/// Handles the plug-in's operations. At first every one succeeds and returns nothing. To be set before the
/// operation is called; called on the library's threads.
struct Script {
  std::function<std::uint32_t(const char*, const char*, const Credentials*)> joinDomain;
  std::function<std::uint32_t(const Credentials*)> partDomain;
  std::function<std::uint32_t(ActiveDirectoryDomainPair*, ActiveDirectoryFree*)> getActiveDomain;
  std::function<std::uint32_t(const char* const*)> setPreferredDomainControllers;
  std::function<std::uint32_t(char***, ActiveDirectoryFree*)> getPreferredDomainControllers;
  std::function<void()> reserved;
  std::function<TrustState()> getDomainTrustState;
  std::function<std::uint32_t(ActiveDirectoryDomainPair***, ActiveDirectoryFree*)> getTrustedDomains;
  std::function<std::uint32_t(char**, ActiveDirectoryFree*)> getMachineAccountDN;
  std::function<std::uint32_t(const char*, const char*, char**, ActiveDirectoryFree*)> getAnyDomainController;
  std::function<std::uint32_t(const char*, char**, ActiveDirectoryFree*)> convertCanonicalUsername;
  std::function<std::uint32_t(const ActiveDirectoryDomainInfo*, const ActiveDirectoryMachineAccountInfo*)>
      joinDomainWithMachineAccount;
  std::function<std::uint32_t(const char*, char**, ActiveDirectoryFree*)> getHostPrincipalForDomain;
  std::function<TrustRelationship(const char*)> getDomainTrustRelationship;
  std::function<std::uint32_t(const char* const*)> setSmartCardEnabledServices;
  std::function<std::uint32_t(char***, ActiveDirectoryFree*)> getSmartCardEnabledServices;
};

/// Installs and configures the plug-in "scripted", and returns its script. Once in a process.
Script& UseScriptedPlugin();

using NamePair = std::pair<std::string, std::string>;

/// Fill the out-parameters of an operation with new memory, and return 0.
std::uint32_t Answer(char** text, ActiveDirectoryFree* release, const std::string& answer);
std::uint32_t Answer(char*** names, ActiveDirectoryFree* release, const std::vector<std::string>& answer);
std::uint32_t Answer(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release, const NamePair& answer);
std::uint32_t Answer(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release,
                     const std::vector<NamePair>& answer);

/// The free functions that Answer() hands out: they release a string, an array of strings, or an array of
/// domain pairs with all that it points to, and note the pointer. Null is noted too.
void ReleaseString(void* memory);
void ReleaseStrings(void* memory);
void ReleaseDomains(void* memory);

/// What the library released so far, in order.
std::vector<void*> Released();

/// A null-terminated array as the library passes it.
std::vector<std::string> ListOf(const char* const* names);

}  // namespace testsupport

#endif  // PLUGINS_SCRIPTED_PLUGIN_H
