/// The jumps of a policy line, in its bytes and in a stack.
#ifndef VELMORCTL_PAM_EDIT_JUMPS_H
#define VELMORCTL_PAM_EDIT_JUMPS_H

#include <cstddef>
#include <cstdint>
#include <string>

#include "pam/stack.h"

namespace velmorctl::pam {

/// The bytes of a policy line with `difference` added to the jumps in its bracketed control that pass over
/// `least` entries or more. All other bytes stay.
std::string WithMovedJumps(const std::string& line, std::int32_t least, int difference);

/// The index of the entry that runs next after entry `from` has jumped over `count` others; the stack's size
/// when none does. A jump that leads out of the stack or substack gives the size and one more.
std::size_t Landing(const Stack& stack, std::size_t from, std::int32_t count);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_JUMPS_H
