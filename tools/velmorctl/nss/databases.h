/// The databases of the name-service switch, and who reads them.
#ifndef VELMORCTL_NSS_DATABASES_H
#define VELMORCTL_NSS_DATABASES_H

#include <string_view>

namespace velmorctl {

/// Whether the C library reads the database.
bool IsLibraryDatabase(std::string_view name);

/// Whether any program is known to read it.
bool IsKnownDatabase(std::string_view name);

/// Whether the C library consults "files" alone when the file has no line for the database.
bool DefaultsToFiles(std::string_view name);

/// Whether local accounts depend on the database: there the local files have to stand first.
bool HoldsLocalAccounts(std::string_view name);

/// Whether the service reads the host's own account files: "files", or "compat", which reads them too.
bool IsLocalService(std::string_view name);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_DATABASES_H
