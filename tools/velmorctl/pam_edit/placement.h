/// Where the directory's module goes in a stack that is kept by hand.
#ifndef VELMORCTL_PAM_EDIT_PLACEMENT_H
#define VELMORCTL_PAM_EDIT_PLACEMENT_H

#include <string>
#include <vector>

#include "pam/stack.h"
#include "pam_edit/directory_module.h"
#include "pam_edit/own_line.h"

namespace velmorctl::pam {

struct Placement {
  std::vector<OwnLine> lines;  /// to be put beside the entry, in this order
  std::string problem;         /// why there is no place; else empty
};

/// The lines that let in whom the directory knows, next to `local`, the entry of the module that knows the
/// local users. All other entries keep their meaning.
Placement PlaceBeside(const StackEntry& local, Facility facility, const DirectoryModule& module);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_PLACEMENT_H
