/// Proof, before anything is written, that a changed service lets in whom it should and nobody else.
#ifndef VELMORCTL_PAM_EDIT_LOGIN_PROOF_H
#define VELMORCTL_PAM_EDIT_LOGIN_PROOF_H

#include <string>

#include "pam/stack.h"

namespace velmorctl::pam {

/// Why the policy with entries of the directory's module is no safe change of the one without; empty when it
/// is one. Logins are played through both, with all that modules may answer: for local users and root each
/// call must end alike by itself, whether the directory is there or not. No user of the directory may come in
/// with a wrong password, while the directory is away, or when it refuses the account, who did not before.
std::string UnsafeChange(const Policy& without, const Policy& with, const std::string& module);

/// Why a user of the directory does not get in, though the directory is there; empty when he does. Where
/// nobody of the host gets in either, that says nothing about the directory's module, and so the reason says.
std::string ShutOut(const Policy& without, const Policy& with, const std::string& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_LOGIN_PROOF_H
