/// The tests of pam_succeed_if.
#ifndef VELMORCTL_PAM_SUCCEED_IF_H
#define VELMORCTL_PAM_SUCCEED_IF_H

#include <string>
#include <vector>

#include "pam/module_answer.h"
#include "pam/person.h"

namespace velmorctl::pam {

/// What the module answers when it has these arguments. `known` tells whether the user can be looked up just
/// now. A test that cannot be decided here (of the terminal, the remote host, netgroups, groups that are not
/// known) holds when `undecidedHolds` says so, and the note tells.
ModuleAnswer SucceedIf(const std::vector<std::string>& arguments, const Person& person,
                       const std::string& service, bool known, bool undecidedHolds);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_SUCCEED_IF_H
