/// The directory's profile among those of pam-auth-update.
#ifndef VELMORCTL_PAM_EDIT_PROFILE_CHANGE_H
#define VELMORCTL_PAM_EDIT_PROFILE_CHANGE_H

#include <string>

#include "pam_edit/directory_module.h"
#include "pam_edit/draft.h"
#include "pam_edit/own_modules.h"

namespace velmorctl::pam {

/// Whether the file is one that pam-auth-update writes, by its name and its marks.
bool IsKeptByProfiles(const Draft& draft, const std::string& name);

/// Puts our profile into the draft, with what pam-auth-update then makes of its files. Throws Failure when
/// pam-auth-update cannot do it, or leaves the files alone because they were changed by hand.
void AddProfile(Draft& draft, const DirectoryModule& module);

/// Takes our profile out, if it is there, with what pam-auth-update then makes of its files. Throws Failure
/// as AddProfile does.
void RemoveProfile(Draft& draft);

/// The modules that pam-auth-update has written for our profile.
OwnModules ModulesOfProfile(const Draft& draft);

/// The profile by which pam-auth-update has written the module; empty when there is none.
std::string ProfileWithModule(const Draft& draft, const std::string& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_PROFILE_CHANGE_H
