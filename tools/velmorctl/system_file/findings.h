/// What a check of system files has found.
#ifndef VELMORCTL_SYSTEM_FILE_FINDINGS_H
#define VELMORCTL_SYSTEM_FILE_FINDINGS_H

#include <string>
#include <vector>

#include "exit_codes.h"
#include "file_problem.h"

namespace velmorctl {

/// Prints the findings on standard output, each with file, line, value, reason and remedy: text for people,
/// or a JSON document of this schema. Returns Difference when there are any, else Fine.
ExitCode PrintFindings(const std::vector<FileProblem>& findings, const std::string& schema, bool json);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_FINDINGS_H
