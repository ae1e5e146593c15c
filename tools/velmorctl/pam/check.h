/// What is wrong with the PAM policies of a system.
#ifndef VELMORCTL_PAM_CHECK_H
#define VELMORCTL_PAM_CHECK_H

#include <functional>
#include <set>
#include <string>
#include <vector>

#include "pam/policy_files.h"
#include "pam/stack.h"

namespace velmorctl::pam {

/// The system that is checked.
struct CheckedSystem {
  FileReader read;
  std::function<bool(const std::string& module)> moduleExists;
  std::function<bool(const std::string& path)> fileExists;
  std::set<std::string> directoryModules;
};

/// Whether people log in through the service: it has auth and account stacks of its own, and a module of the
/// auth stack asks for a password. "other" is none.
bool IsLoginService(const Policy& policy, const std::set<std::string>& directoryModules);

/// Looks for lines that libpam cannot read, files and modules that are not there, and lines that nothing ever
/// reaches. In a login service a local user, or root, with the right password must get in when the directory
/// is away; and nobody may get in with a wrong password, in any service that has an auth stack.
std::vector<Finding> CheckService(const std::string& service, const CheckedSystem& system);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_CHECK_H
