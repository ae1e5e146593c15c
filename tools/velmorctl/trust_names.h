/// Names of the states of a trust.
#ifndef VELMORCTL_TRUST_NAMES_H
#define VELMORCTL_TRUST_NAMES_H

#include <string>

#include "authentication/directory_records.h"
#include "exit_codes.h"

namespace velmorctl {

/// The state's name, as it is printed; "unnamed (N)" for a number that has no name.
std::string TrustStateName(TrustState state);

/// What the state means for the exit code when it is the provider's own answer.
ExitCode TrustStateExitCode(TrustState state);

std::string TrustRelationshipName(TrustRelationship relationship);

}  // namespace velmorctl

#endif  // VELMORCTL_TRUST_NAMES_H
