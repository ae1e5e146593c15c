/// Ways through a stack.
#ifndef VELMORCTL_PAM_STACK_WALK_H
#define VELMORCTL_PAM_STACK_WALK_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "pam/stack.h"

namespace velmorctl::pam {

/// The index of the last entry of the stack or substack in which the entry at `index` is.
std::size_t LastOfStack(const Stack& stack, std::size_t index);

/// Where a jump from one entry leads.
struct JumpTarget {
  std::size_t last = 0;  /// the index of the last entry that is passed over
  bool inStack = true;   /// there were as many entries to pass over in the same stack or substack
};

/// A jump over `count` entries; a substack counts as one.
JumpTarget TargetOfJump(const Stack& stack, std::size_t index, std::int32_t count);

/// Which entries libpam can get to, by their index, whatever the modules answer. pam_permit and pam_deny are
/// known to answer always the same.
std::vector<bool> ReachableEntries(const Stack& stack);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_STACK_WALK_H
