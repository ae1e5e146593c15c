/// Proving that an edit of the name-service switch file means what it was meant to mean.
#ifndef VELMORCTL_NSS_EDIT_PROOF_H
#define VELMORCTL_NSS_EDIT_PROOF_H

#include <string>
#include <vector>

#include "nss/switch_file.h"

namespace velmorctl {

/// The line that was changed or added, and what it is to mean.
struct WantedLine {
  int number;
  std::string database;
  std::vector<ServiceMeaning> services;
};

/// Throws Failure (Other) unless every line but the wanted one has the same bytes before and after, the
/// wanted one means what it is to mean, and the second opinion agrees.
void ProveEdit(const SwitchFile& before, const SwitchFile& after, const std::string& shown,
               const WantedLine& wanted);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_EDIT_PROOF_H
