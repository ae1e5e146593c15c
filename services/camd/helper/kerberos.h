// The log-on of the service's account.
#ifndef CAMD_HELPER_KERBEROS_H
#define CAMD_HELPER_KERBEROS_H

#include <string>

#include "common/secret.h"

namespace camd {

// Asks once for a ticket for `user` in `realm` and keeps it where GSSAPI finds it until the process ends.
// Blocks as long as the Kerberos library does, some seconds per controller. Throws Failure:
// kServiceLogonFailed when the user is refused, kNoLogonServers when no controller answers, kTimeSkew when
// the clocks differ too much.
void LogOn(const std::string& realm, const std::string& user, const Secret& password);

}  // namespace camd

#endif  // CAMD_HELPER_KERBEROS_H
