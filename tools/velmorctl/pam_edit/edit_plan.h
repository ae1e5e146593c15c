/// How the directory's module comes into the policies of a host, and out of them again.
#ifndef VELMORCTL_PAM_EDIT_EDIT_PLAN_H
#define VELMORCTL_PAM_EDIT_EDIT_PLAN_H

#include <optional>
#include <string>
#include <vector>

#include "pam_edit/directory_module.h"
#include "pam_edit/draft.h"
#include "system_file/root_folder.h"

namespace velmorctl::pam {

struct Refusal {
  std::string service;
  std::string reason;
};

struct EditPlan {
  Draft files;                     /// as they would be
  std::vector<std::string> notes;  /// what the administrator should know, in whole sentences
  std::vector<Refusal> refusals;   /// services that stay as they are, though they were meant to change
};

/// Plans to put the module into each service that people log in through: by its profile where
/// pam-auth-update keeps the files, and else beside the local users' module. What was put in before and is
/// not meant any more goes. Each service is proved, and stays as it is when the proof fails. A service that
/// would let no user of the directory in all the same does not hold up those that share its files. Throws
/// Failure when nothing can be planned, or when a service that is refused would lose what was put in before.
EditPlan PlanEnable(const RootFolder& root, const DirectoryModule& module);

/// Plans to take out what PlanEnable has put in, byte for byte. `module` is the provider's, if it is known;
/// lines for it that the administrator has written stay, and the plan's notes name them. Throws Failure when
/// a service would not be what it was.
EditPlan PlanDisable(const RootFolder& root, const std::optional<DirectoryModule>& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_EDIT_PLAN_H
