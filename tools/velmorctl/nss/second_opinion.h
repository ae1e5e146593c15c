/// What the library's model of the name-service switch says to an edit.
#ifndef VELMORCTL_NSS_SECOND_OPINION_H
#define VELMORCTL_NSS_SECOND_OPINION_H

#include "nss/edit_proof.h"
#include "nss/switch_file.h"

namespace velmorctl {

/// False when SystemConfiguration::NSSConfiguration reads the new text otherwise than the old one with the
/// edit: in another database, or in the edited one where it read the old line without loss. The model has no
/// opinion, so that nothing is held against the edit, where it throws or loses a part of the line: where one
/// of several services has a criterion, behind trailing white space, and in databases that it does not know.
bool ModelAgrees(const SwitchFile& before, const SwitchFile& after, const WantedLine& wanted);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_SECOND_OPINION_H
