/// The entry that keeps local users from the directory's module. A directory may have an account with the
/// name of a local one, root's included; its password must not open the local account.
#ifndef VELMORCTL_PAM_EDIT_LOCAL_GUARD_H
#define VELMORCTL_PAM_EDIT_LOCAL_GUARD_H

namespace velmorctl::pam {

inline constexpr char guardModule[] = "pam_localuser.so";

/// A local user passes over the one entry behind it, which is the directory's.
inline constexpr char guardControl[] = "[success=1 default=ignore]";

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_LOCAL_GUARD_H
