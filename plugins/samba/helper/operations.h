/// What the helper can do. Each operation runs under the OperationLock, after what was interrupted before has
/// been put right, and throws Failure. Each is safe to be killed anywhere: the next one puts things right.
#ifndef SAMBA_HELPER_OPERATIONS_H
#define SAMBA_HELPER_OPERATIONS_H

#include <string>

#include "common/attempt_log.h"
#include "common/message.h"
#include "common/settings.h"

namespace sambaprovider {

/// What every operation is given.
struct Call {
  const AttemptLog& log;
  const Settings& settings;
  const Request& request;
};

/// "domain", "organizationalUnit" (may be empty), "user", and the password. Returns what was done, in a line.
std::string Join(const Call& call);

/// "dnsDomain", "netbiosDomain", "accountName", and the join blob. Uses no network.
std::string JoinWithMachineAccount(const Call& call);

/// "user" and the password, or neither for a leave that needs no account and no network.
std::string Leave(const Call& call);

/// "names": the controllers to use first.
std::string PreferControllers(const Call& call);

/// Makes the keytab anew when the machine's password has changed since it was made, changes both when the
/// password is a week old, and learns the machine account's name, since the account may have been moved.
/// Needs a controller.
std::string Refresh(const Call& call);

/// Puts an interrupted operation right. Does it on its own before every other one, too; only here the request
/// may bring "user" and the password of the interrupted join, to remove the account that it made.
std::string Recover(const Call& call);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_OPERATIONS_H
