/// A second opinion on a changed policy file, from the library's own model of such files. True as well where
/// the model cannot read the file that is to change without loss, such as one that includes others.
#ifndef VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H
#define VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H

#include <string>

#include "pam_edit/own_modules.h"

namespace velmorctl::pam {

/// Whether the library's model sees in `after` what it sees in `before` and nothing more than entries of the
/// own modules, and those that make up for one that is passed over.
bool ModelSeesOwnAdded(const std::string& before, const std::string& after, const OwnModules& own);

/// The same the other way round: nothing less than such entries.
bool ModelSeesOwnRemoved(const std::string& before, const std::string& after, const OwnModules& own);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H
