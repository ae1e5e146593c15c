/*
 * The two symbols of a plug-in. A plug-in of this folder defines, before it includes this, what is special in
 * it: METADATA_VERSION, TABLE_VERSION, PAM_PARAMETERS, NSS_PARAMETERS, or one of the slots. All other slots
 * are null.
 */
#ifndef PLUGINS_TABLE_H
#define PLUGINS_TABLE_H

#include "authentication/plugin/active_directory_client.h"

#ifndef METADATA_VERSION
#define METADATA_VERSION 3
#endif
#ifndef TABLE_VERSION
#define TABLE_VERSION 3
#endif
#ifndef PAM_PARAMETERS
#define PAM_PARAMETERS "pam_first pam_second"
#endif
#ifndef NSS_PARAMETERS
#define NSS_PARAMETERS "nss_first"
#endif
#ifndef GET_ACTIVE_DOMAIN
#define GET_ACTIVE_DOMAIN 0
#endif
#ifndef GET_TRUSTED_DOMAINS
#define GET_TRUSTED_DOMAINS 0
#endif
#ifndef JOIN_DOMAIN_WITH_MACHINE_ACCOUNT
#define JOIN_DOMAIN_WITH_MACHINE_ACCOUNT 0
#endif
#ifndef GET_HOST_PRINCIPAL_FOR_DOMAIN
#define GET_HOST_PRINCIPAL_FOR_DOMAIN 0
#endif
#ifndef GET_DOMAIN_TRUST_RELATIONSHIP
#define GET_DOMAIN_TRUST_RELATIONSHIP 0
#endif
#ifndef SET_SMART_CARD_ENABLED_SERVICES
#define SET_SMART_CARD_ENABLED_SERVICES 0
#endif
#ifndef GET_SMART_CARD_ENABLED_SERVICES
#define GET_SMART_CARD_ENABLED_SERVICES 0
#endif

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {
    METADATA_VERSION, "pam_test", PAM_PARAMETERS, "nss_test", NSS_PARAMETERS};

const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {
    .apiVersion = TABLE_VERSION,
    .getActiveDomain = GET_ACTIVE_DOMAIN,
    .getTrustedDomains = GET_TRUSTED_DOMAINS,
    .joinDomainWithMachineAccount = JOIN_DOMAIN_WITH_MACHINE_ACCOUNT,
    .getHostPrincipalForDomain = GET_HOST_PRINCIPAL_FOR_DOMAIN,
    .getDomainTrustRelationship = GET_DOMAIN_TRUST_RELATIONSHIP,
    .setSmartCardEnabledServices = SET_SMART_CARD_ENABLED_SERVICES,
    .getSmartCardEnabledServices = GET_SMART_CARD_ENABLED_SERVICES,
};

#endif /* PLUGINS_TABLE_H */
