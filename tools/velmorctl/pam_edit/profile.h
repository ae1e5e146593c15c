/// The profile by which pam-auth-update knows the directory's module.
#ifndef VELMORCTL_PAM_EDIT_PROFILE_H
#define VELMORCTL_PAM_EDIT_PROFILE_H

#include <string>

#include "pam_edit/directory_module.h"

namespace velmorctl::pam {

inline constexpr char profileName[] = "velmor";

/// The text of the profile, in the format of pam-auth-update.
std::string ProfileText(const DirectoryModule& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_PROFILE_H
