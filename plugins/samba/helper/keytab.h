/// The host's keytab and its account's name, both had with the machine's own password.
#ifndef SAMBA_HELPER_KEYTAB_H
#define SAMBA_HELPER_KEYTAB_H

#include <string>

namespace sambaprovider {

/// Makes the keytab from the machine's present password. smb.conf must say that a keytab is kept. Asks the
/// given controller, which after a join is the only one that is sure to know the account; any one when it is
/// empty. Takes half a second, half a minute at most. Throws Failure (kInternalError) with the reason.
void MakeKeytab(const std::string& controller);

/// Asks the directory for the DN of this host's computer account. Throws Failure (kInternalError).
std::string FindMachineAccountDn(const std::string& computer);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_KEYTAB_H
