/// What a failure of the library or of the host means for the administrator.
#ifndef VELMORCTL_EXPLAIN_H
#define VELMORCTL_EXPLAIN_H

#include <exception>
#include <string>
#include <vector>

#include "failure.h"
#include "situation.h"

namespace velmorctl {

/// Turns any exception into a failure with an exit code and advice. Where the library's text does not say
/// which file, line or value is to blame, the files are looked at.
Failure Explain(const std::exception& exception, const Situation& situation);

/// The report of a failure, in lines for standard error: what happened, the details, what was changed, what
/// to try.
std::string FailureReport(const Failure& failure, const Situation& situation);

}  // namespace velmorctl

#endif  // VELMORCTL_EXPLAIN_H
