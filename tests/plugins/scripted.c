/* Hands every operation on to the test; see scripted_plugin.h. */
#include "authentication/plugin/active_directory_client.h"

extern __attribute__((visibility("default"))) struct ActiveDirectoryClientOperations scriptedAnswers;
struct ActiveDirectoryClientOperations scriptedAnswers;

static uint32_t joinDomain(const char* domain, const char* organizationalUnit,
                           const Credentials* credentials) {
  return scriptedAnswers.joinDomain(domain, organizationalUnit, credentials);
}

static uint32_t partDomain(const Credentials* credentials) {
  return scriptedAnswers.partDomain(credentials);
}

static uint32_t getActiveDomain(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
  return scriptedAnswers.getActiveDomain(domain, release);
}

static uint32_t setPreferredDomainControllers(const char* const* names) {
  return scriptedAnswers.setPreferredDomainControllers(names);
}

static uint32_t getPreferredDomainControllers(char*** names, ActiveDirectoryFree* release) {
  return scriptedAnswers.getPreferredDomainControllers(names, release);
}

static void reserved(void) {
  scriptedAnswers.reserved();
}

static TrustState getDomainTrustState(void) {
  return scriptedAnswers.getDomainTrustState();
}

static uint32_t getTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
  return scriptedAnswers.getTrustedDomains(domains, release);
}

static uint32_t getMachineAccountDN(char** text, ActiveDirectoryFree* release) {
  return scriptedAnswers.getMachineAccountDN(text, release);
}

static uint32_t getAnyDomainController(const char* qualifier, const char* domain, char** text,
                                       ActiveDirectoryFree* release) {
  return scriptedAnswers.getAnyDomainController(qualifier, domain, text, release);
}

static uint32_t convertCanonicalUsername(const char* name, char** text, ActiveDirectoryFree* release) {
  return scriptedAnswers.convertCanonicalUsername(name, text, release);
}

static uint32_t joinDomainWithMachineAccount(const ActiveDirectoryDomainInfo* domain,
                                             const ActiveDirectoryMachineAccountInfo* account) {
  return scriptedAnswers.joinDomainWithMachineAccount(domain, account);
}

static uint32_t getHostPrincipalForDomain(const char* domain, char** text, ActiveDirectoryFree* release) {
  return scriptedAnswers.getHostPrincipalForDomain(domain, text, release);
}

static TrustRelationship getDomainTrustRelationship(const char* domain) {
  return scriptedAnswers.getDomainTrustRelationship(domain);
}

static uint32_t setSmartCardEnabledServices(const char* const* names) {
  return scriptedAnswers.setSmartCardEnabledServices(names);
}

static uint32_t getSmartCardEnabledServices(char*** names, ActiveDirectoryFree* release) {
  return scriptedAnswers.getSmartCardEnabledServices(names, release);
}

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {3, "pam_scripted", "a b",
                                                                            "scripted", "c"};

const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {
    3,
    joinDomain,
    partDomain,
    getActiveDomain,
    setPreferredDomainControllers,
    getPreferredDomainControllers,
    reserved,
    getDomainTrustState,
    getTrustedDomains,
    getMachineAccountDN,
    getAnyDomainController,
    convertCanonicalUsername,
    joinDomainWithMachineAccount,
    getHostPrincipalForDomain,
    getDomainTrustRelationship,
    setSmartCardEnabledServices,
    getSmartCardEnabledServices,
};
