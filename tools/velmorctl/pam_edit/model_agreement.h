/// A second opinion on a changed policy file, from the library's own model of such files.
#ifndef VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H
#define VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H

#include <string>

#include "pam_edit/own_modules.h"

namespace velmorctl::pam {

/// Whether the library's model sees in `with` what it sees in `without` and nothing more than entries of the
/// own modules, and those that make up for one that is passed over. True as well for a file that the model
/// cannot read without loss, such as one that includes others.
bool ModelAgrees(const std::string& without, const std::string& with, const OwnModules& own);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_MODEL_AGREEMENT_H
