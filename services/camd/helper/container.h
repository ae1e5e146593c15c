// The forms in which clients write the container of an account.
#ifndef CAMD_HELPER_CONTAINER_H
#define CAMD_HELPER_CONTAINER_H

#include <string>
#include <string_view>

namespace camd {

// Returns the distinguished name of a container of the domain with the base `baseDn` ("DC=corp,DC=example"),
// which may be written as
//   - a full name, "OU=Hosts,OU=Servers,DC=corp,DC=example";
//   - a name without the domain's part, "OU=Hosts,OU=Servers";
//   - a path from the top, "Servers/Hosts" or "OU=Servers/OU=Hosts"; a part without a type is a unit.
// Throws Failure (kInvalidContainer) for anything else.
std::string ContainerDn(std::string_view text, std::string_view baseDn);

}  // namespace camd

#endif  // CAMD_HELPER_CONTAINER_H
