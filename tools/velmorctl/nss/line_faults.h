/// Faults of a line as problems for the administrator.
#ifndef VELMORCTL_NSS_LINE_FAULTS_H
#define VELMORCTL_NSS_LINE_FAULTS_H

#include <string>

#include "file_problem.h"
#include "nss/switch_file.h"

namespace velmorctl {

/// `shown` names the file.
FileProblem FaultProblem(const LineFault& fault, const SwitchLine& line, const std::string& shown);

/// A problem of the line with these texts.
FileProblem LineProblem(const std::string& shown, const SwitchLine& line, const std::string& value,
                        const std::string& reason, const std::string& remedy);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_LINE_FAULTS_H
