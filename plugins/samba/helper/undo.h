/// Putting right what did not come to its end.
#ifndef SAMBA_HELPER_UNDO_H
#define SAMBA_HELPER_UNDO_H

#include <string>

#include "common/attempt_log.h"
#include "helper/journal.h"
#include "velmor/secret.h"

namespace sambaprovider {

/// The account that a join was started with, when it is at hand.
struct UndoAccount {
  std::string user;
  const velmor::Secret& password;
};

/// Takes a join back as far as it got: remembered domain, machine secrets, computer account when the join
/// made it and `account` is not null, smb.conf, keytab, winbindd. Goes on when a part fails and records it;
/// the journal stays when the host's own files could not be restored, so that the next run tries again.
void UndoJoin(const AttemptLog& log, const Journal& journal, const UndoAccount* account);

/// The part of a leave after the machine's secrets are gone; may be done again. Throws Failure.
void FinishLeave(const AttemptLog& log);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_UNDO_H
