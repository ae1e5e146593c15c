/// Whether a stack was changed in the way that was asked for, and in no other.
#ifndef VELMORCTL_PAM_EDIT_STACK_DIFFERENCE_H
#define VELMORCTL_PAM_EDIT_STACK_DIFFERENCE_H

#include <string>

#include "pam/stack.h"
#include "pam_edit/own_modules.h"

namespace velmorctl::pam {

/// Whether velmorctl puts such an entry beside the local users' module: an own module, or what makes
/// up for a module that is passed over.
bool IsOwnEntry(const StackEntry& entry, const OwnModules& own);

/// Why `with` is something else than `without` and own entries between its entries; empty when it is that.
/// Every other entry must be the same, from the same file and in the same order, and its jumps must lead to
/// the same entry, or to an own one just before it.
std::string UnexpectedDifference(const Stack& without, const Stack& with, const OwnModules& own);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_STACK_DIFFERENCE_H
