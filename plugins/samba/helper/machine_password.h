/// Looks into Samba's secrets without libnetapi. Must not be used in a process that has used libnetapi, which
/// keeps the same file open and would lose its locks.
#ifndef SAMBA_HELPER_MACHINE_PASSWORD_H
#define SAMBA_HELPER_MACHINE_PASSWORD_H

#include <cstdint>
#include <optional>
#include <string>

namespace sambaprovider {

/// When the machine's password for the domain was last changed, in seconds since 1970; nothing when the host
/// has none, as before a join and after a leave.
std::optional<int64_t> MachinePasswordTime(const std::string& netbiosDomain);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_MACHINE_PASSWORD_H
