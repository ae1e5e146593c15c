/// The log-on of the person who joins the host.
#ifndef SAMBA_PRECHECK_KERBEROS_H
#define SAMBA_PRECHECK_KERBEROS_H

#include <cstdint>
#include <string>

#include "common/names.h"
#include "velmor/secret.h"

namespace sambaprovider {

/// The status for an error of the Kerberos library.
uint32_t StatusOfKerberosError(int32_t error);

/// Asks once for a ticket for `account` in `realm` and keeps it where GSSAPI finds it, until the process
/// ends. A name with a domain of its own is left to the controller to understand. Throws Failure with the
/// reason.
void LogOn(const std::string& realm, const AccountName& account, const velmor::Secret& password);

}  // namespace sambaprovider

#endif  // SAMBA_PRECHECK_KERBEROS_H
