// A Samba configuration and state of this process's own.
#ifndef CAMD_PROVISION_PRIVATE_CONFIGURATION_H
#define CAMD_PROVISION_PRIVATE_CONFIGURATION_H

#include <string>

namespace camd {

// Hides /etc/samba from this process behind a folder in memory with an smb.conf for the domain, in which all
// of Samba's state lies too. libnetapi reads that one path only, wants the realm there, and opens a database
// of secrets that on the machine belongs to root; this way the machine need be no member, this process needs
// no rights, and nothing of it stays on a disk. An unprivileged caller gets a user namespace for that. Call
// it while the process has one thread. Throws Failure (kInternalError).
void UsePrivateConfiguration(const std::string& netbiosDomain, const std::string& realm);

}  // namespace camd

#endif  // CAMD_PROVISION_PRIVATE_CONFIGURATION_H
