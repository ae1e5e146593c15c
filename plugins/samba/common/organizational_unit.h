/// The forms in which callers write an organisational unit.
#ifndef SAMBA_COMMON_ORGANIZATIONAL_UNIT_H
#define SAMBA_COMMON_ORGANIZATIONAL_UNIT_H

#include <string>
#include <string_view>

namespace sambaprovider {

/// Returns the distinguished name of an organisational unit below `baseDn` ("DC=corp,DC=example"), which may
/// be written as
///   - a full DN, "OU=Hosts,OU=Servers,DC=corp,DC=example": returned as it is;
///   - a DN without the domain's part, "OU=Hosts,OU=Servers": the base is appended;
///   - a path from the top, "Servers/Hosts" or "OU=Servers/OU=Hosts". Empty parts are skipped; a part may
///   begin
///     with "CN=" for a container. What has a meaning in a DN is escaped.
/// Throws Failure (kInvalidOrganizationalUnit) for text without any part and for one with a control
/// character.
std::string OrganizationalUnitDn(std::string_view text, std::string_view baseDn);

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_ORGANIZATIONAL_UNIT_H
