// The two symbols that the plug-in exports.
#include "authentication/plugin/active_directory_client.h"
#include "plugin/slots.h"

namespace slots = sambaprovider::slots;

extern "C" {

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {
    .apiVersion = ACTIVE_DIRECTORY_CLIENT_API_VERSION,
    .pamModule = "pam_winbind.so",
    .pamModuleParameters = nullptr,
    .nssModule = "winbind",
    .nssModuleParameters = nullptr,
};

const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {
    .apiVersion = ACTIVE_DIRECTORY_CLIENT_API_VERSION,
    .joinDomain = slots::JoinDomain,
    .partDomain = slots::PartDomain,
    .getActiveDomain = slots::GetActiveDomain,
    .setPreferredDomainControllers = slots::SetPreferredDomainControllers,
    .getPreferredDomainControllers = slots::GetPreferredDomainControllers,
    .reserved = nullptr,
    .getDomainTrustState = slots::GetDomainTrustState,
    .getTrustedDomains = slots::GetTrustedDomains,
    .getMachineAccountDN = slots::GetMachineAccountDN,
    .getAnyDomainController = slots::GetAnyDomainController,
    .convertCanonicalUsername = slots::ConvertCanonicalUsername,
    .joinDomainWithMachineAccount = slots::JoinDomainWithMachineAccount,
    .getHostPrincipalForDomain = slots::GetHostPrincipalForDomain,
    .getDomainTrustRelationship = slots::GetDomainTrustRelationship,
    .setSmartCardEnabledServices = slots::SetSmartCardEnabledServices,
    .getSmartCardEnabledServices = slots::GetSmartCardEnabledServices,
};

}  // extern "C"
