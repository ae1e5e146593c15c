/// The table of the library's failures: the exit code and the advice for each.
#ifndef VELMORCTL_MEANINGS_H
#define VELMORCTL_MEANINGS_H

#include <exception>

#include "exit_codes.h"

namespace velmorctl {

struct Meaning {
  ExitCode code = ExitCode::Other;
  const char* advice = "";
  bool missingOperation = false;  /// the provider does not have what was asked of it
};

/// What a failure of the library or the platform means, found by its code or, when it has none, by its class.
const Meaning& MeaningOf(const std::exception& exception);

}  // namespace velmorctl

#endif  // VELMORCTL_MEANINGS_H
