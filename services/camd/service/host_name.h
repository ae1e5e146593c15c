// Names of hosts: which are possible, and which are allowed.
#ifndef CAMD_SERVICE_HOST_NAME_H
#define CAMD_SERVICE_HOST_NAME_H

#include <string>
#include <string_view>
#include <vector>

namespace camd {

// Whether this is a host's DNS name: labels of letters, digits and hyphens, at most 253 bytes in all.
bool IsHostName(std::string_view name);

// The name of the host's computer account: its first label in upper case. Empty when that cannot be one: it
// must have 1 to 15 letters, digits and hyphens, no hyphen at either end, and not digits alone.
std::string ComputerNameOf(std::string_view hostName);

// Whether the name fits one of the patterns, in which "*" stands for any text and "?" for any character. Case
// does not count. A pattern with a dot is compared with the whole name, one without with the first label.
bool FitsAnyPattern(std::string_view hostName, const std::vector<std::string>& patterns);

}  // namespace camd

#endif  // CAMD_SERVICE_HOST_NAME_H
