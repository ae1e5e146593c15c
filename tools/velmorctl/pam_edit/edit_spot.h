/// The places in a service's stacks beside which the directory's module belongs.
#ifndef VELMORCTL_PAM_EDIT_EDIT_SPOT_H
#define VELMORCTL_PAM_EDIT_EDIT_SPOT_H

#include <string>
#include <vector>

#include "pam/stack.h"
#include "pam_edit/directory_module.h"
#include "pam_edit/draft.h"
#include "pam_edit/own_line.h"

namespace velmorctl::pam {

struct EditSpot {
  std::string file;
  std::size_t line = 0;
  bool byProfile = false;      /// pam-auth-update keeps the file, and knows the place itself
  std::vector<OwnLine> lines;  /// to be put in there; else empty

  bool operator<(const EditSpot& other) const;
};

struct EditSpots {
  std::vector<EditSpot> spots;
  std::string problem;  /// why the service cannot be changed; else empty
};

/// The entry of the module in the stack that decides who the user is; null when it is not there.
const StackEntry* AuthEntryOf(const Policy& policy, const std::string& module);

/// Where the module goes in the stacks of a login service: beside the first entry of the local users' module
/// in each. A service needs it for auth and account; it does without where it has no such entry for password
/// or session.
EditSpots FindEditSpots(const Draft& draft, const Policy& policy, const DirectoryModule& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_EDIT_SPOT_H
