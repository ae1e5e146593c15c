/// What a line of the directory's module says, apart from the place where it stands.
#ifndef VELMORCTL_PAM_EDIT_MODULE_LINE_H
#define VELMORCTL_PAM_EDIT_MODULE_LINE_H

#include <string>

#include "pam_edit/directory_module.h"

namespace velmorctl::pam {

/// The control of the account line. A directory that says no is obeyed. One that does not know the user, or
/// that cannot be asked, has no say: else nobody could log in while it is away.
inline constexpr char accountControl[] =
    "[success=ok new_authtok_reqd=ok ignore=ignore user_unknown=ignore authinfo_unavail=ignore "
    "service_err=ignore system_err=ignore module_unknown=ignore default=bad]";

/// The module with the provider's parameters, and `more` behind them unless it is empty.
std::string ModuleText(const DirectoryModule& module, const std::string& more = "");

/// The parameter by which the module takes the password that was asked for before it. Empty when the
/// provider's parameters say already how it gets its password.
std::string PasswordParameter(const DirectoryModule& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_MODULE_LINE_H
