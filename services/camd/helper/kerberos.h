// One Kerberos log-on with a password, in this process's memory only.
#ifndef CAMD_HELPER_KERBEROS_H
#define CAMD_HELPER_KERBEROS_H

#include <string>

#include "common/secret.h"

namespace camd {

// Makes the Kerberos and GSSAPI libraries of this process look controllers up in DNS, or ask `controller`
// where that is not empty, and take host names as they are. Call it before any other use of them and before
// any thread is started, since it changes the environment. Throws Failure (kInternalError).
void PrepareKerberos(const std::string& realm, const std::string& controller);

// Gets a ticket for `user` in `realm` and keeps it where GSSAPI finds it until the process ends. Blocks as
// long as the Kerberos library does, some seconds per controller. Throws Failure: kServiceLogonFailed when
// the user is refused, kNoLogonServers when no controller answers, kTimeSkew when the clocks differ too much.
void LogOn(const std::string& realm, const std::string& user, const Secret& password);

}  // namespace camd

#endif  // CAMD_HELPER_KERBEROS_H
