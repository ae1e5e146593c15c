/// What the host had before the join, put aside so that a failed join or a leave gives it back.
#ifndef SAMBA_HELPER_BEFORE_JOIN_H
#define SAMBA_HELPER_BEFORE_JOIN_H

namespace sambaprovider::before_join {

/// Puts copies of smb.conf and the keytab aside, durably, with their owners and modes, and notes whether
/// winbindd runs. What was put aside earlier is dropped. Throws Failure (kInternalError).
void PutAside();

/// Gives both files back; those that did not exist are removed. An smb.conf that an administrator has written
/// since is left alone. Keeps the copies, so that it can be done again. Throws Failure (kInternalError).
void GiveBack();

bool ServiceWasRunning();

void DropCopies();

}  // namespace sambaprovider::before_join

#endif  // SAMBA_HELPER_BEFORE_JOIN_H
