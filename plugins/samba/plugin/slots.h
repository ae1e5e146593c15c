/// The operations of the plug-in's table; active_directory_client.h says what each one does.
#ifndef SAMBA_PLUGIN_SLOTS_H
#define SAMBA_PLUGIN_SLOTS_H

#include "authentication/plugin/active_directory_client.h"

namespace sambaprovider::slots {

extern "C" {

uint32_t JoinDomain(const char* domain, const char* organizationalUnit, const Credentials* credentials);
uint32_t PartDomain(const Credentials* credentials);
uint32_t JoinDomainWithMachineAccount(const ActiveDirectoryDomainInfo* domain,
                                      const ActiveDirectoryMachineAccountInfo* account);

uint32_t GetActiveDomain(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release);
uint32_t GetMachineAccountDN(char** text, ActiveDirectoryFree* release);
uint32_t GetHostPrincipalForDomain(const char* domain, char** text, ActiveDirectoryFree* release);

uint32_t SetPreferredDomainControllers(const char* const* names);
uint32_t GetPreferredDomainControllers(char*** names, ActiveDirectoryFree* release);
uint32_t SetSmartCardEnabledServices(const char* const* names);
uint32_t GetSmartCardEnabledServices(char*** names, ActiveDirectoryFree* release);

TrustState GetDomainTrustState(void);
TrustRelationship GetDomainTrustRelationship(const char* domain);
uint32_t GetTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release);

/// The qualifier is the name of a site.
uint32_t GetAnyDomainController(const char* qualifier, const char* domain, char** text,
                                ActiveDirectoryFree* release);
uint32_t ConvertCanonicalUsername(const char* name, char** text, ActiveDirectoryFree* release);

}  // extern "C"

}  // namespace sambaprovider::slots

#endif  // SAMBA_PLUGIN_SLOTS_H
