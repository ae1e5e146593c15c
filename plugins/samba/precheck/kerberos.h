/// One Kerberos log-on with a password, in this process's memory only.
#ifndef SAMBA_PRECHECK_KERBEROS_H
#define SAMBA_PRECHECK_KERBEROS_H

#include <cstdint>
#include <memory>
#include <string>

#include "common/names.h"
#include "velmor/secret.h"

namespace sambaprovider {

/// The status for an error of the Kerberos library.
uint32_t StatusOfKerberosError(int32_t error);

/// Makes the Kerberos and GSSAPI libraries of this process ask the given controller for the realm, and take
/// host names as they are. The host's own krb5.conf still counts for all else. Call it before any other use
/// of them and before any thread is started, since it changes the environment. Throws Failure
/// (kInternalError).
void DirectKerberosTo(const std::string& realm, const std::string& controller);

/// Asks once for a ticket for `account` in `realm` and keeps it where GSSAPI finds it, until the process
/// ends. A name with a domain of its own is left to the controller to understand. Throws Failure with the
/// reason.
void LogOn(const std::string& realm, const AccountName& account, const velmor::Secret& password);

}  // namespace sambaprovider

#endif  // SAMBA_PRECHECK_KERBEROS_H
