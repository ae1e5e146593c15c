/// Names of hosts, domains and users: which are possible, and their parts.
#ifndef SAMBA_COMMON_NAMES_H
#define SAMBA_COMMON_NAMES_H

#include <string>
#include <string_view>

namespace sambaprovider {

std::string LowerCase(std::string_view text);
std::string UpperCase(std::string_view text);
bool EqualWithoutCase(std::string_view left, std::string_view right);

/// Whether a computer account may have this name: 1 to 15 letters, digits and hyphens, with no hyphen at
/// either end and not digits alone.
bool IsComputerName(std::string_view name);

/// Whether this is a DNS name: labels of letters, digits, hyphens and underscores, at most 255 bytes in all.
/// Says also that the name may stand in a configuration file without quoting.
bool IsDnsName(std::string_view name);

/// Whether this may be a domain's NetBIOS name: 1 to 15 bytes, none of which a configuration file or a path
/// gives a meaning to.
bool IsNetbiosName(std::string_view name);

/// Whether this names a domain controller: a DNS name, an IPv4 address or an IPv6 address.
bool IsControllerName(std::string_view name);

/// An account name in its parts.
struct AccountName {
  std::string user;
  std::string domain;  // empty when the name had none
};

/// Splits "name", "DOMAIN\name" and "name@domain".
AccountName SplitAccountName(std::string_view name);

/// The domain without the one dot that may end it.
std::string WithoutTrailingDot(std::string_view domain);

/// The distinguished name of a DNS domain, "DC=corp,DC=example".
std::string DomainDn(std::string_view dnsDomain);

/// The host's name before its first dot. Throws Failure (kInvalidComputerName) when it cannot be read or is
/// no computer name.
std::string HostShortName();

/// The host's DNS name inside the domain, as the directory keeps it.
std::string HostDnsName(std::string_view shortName, std::string_view dnsDomain);

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_NAMES_H
