/// The name-service module of the provider in use.
#ifndef VELMORCTL_NSS_PROVIDER_SERVICE_H
#define VELMORCTL_NSS_PROVIDER_SERVICE_H

#include <string>

#include "nss/switch_edit.h"
#include "nss/switch_file.h"
#include "system_file/root_folder.h"

namespace velmorctl {

/// The service that the provider's plug-in names, with its parameters as the words of the criterion. Throws
/// Failure: what ActiveProvider() throws, and ProviderUnusable when the plug-in names no service.
ServiceMeaning ProviderService(const RootFolder& root);

/// The service called `name`: with the provider's parameters when it is the provider's, else without any, as
/// for every name where there is no usable provider.
ServiceMeaning ServiceCalled(const std::string& name, const RootFolder& root);

/// Puts the service into the databases in which a directory's accounts are looked up: passwd and group, and
/// initgroups when that has a line, since group is then not asked for the groups of a user. A database that
/// AddService() refuses stays as it is, with a warning that says why; its failure is thrown when nothing else
/// changes either.
SwitchEdit AddToAccountDatabases(const SwitchFile& file, const std::string& shown,
                                 const ServiceMeaning& service);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_PROVIDER_SERVICE_H
