#ifndef VELMORCTL_PAM_EDIT_OWN_MODULES_H
#define VELMORCTL_PAM_EDIT_OWN_MODULES_H

#include <set>
#include <string>

namespace velmorctl::pam {

/// The PAM modules for which velmorctl puts in or takes out entries, as policy files name them: the one of
/// the provider in use, and those of providers that were in use when entries were put in.
using OwnModules = std::set<std::string>;

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_OWN_MODULES_H
