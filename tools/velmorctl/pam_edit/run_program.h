/// Running a program of the system, without a shell.
#ifndef VELMORCTL_PAM_EDIT_RUN_PROGRAM_H
#define VELMORCTL_PAM_EDIT_RUN_PROGRAM_H

#include <string>
#include <vector>

namespace velmorctl::pam {

struct ProgramRun {
  bool started = false;
  std::string ending;  /// how it ended, in words; empty when it ended with status 0
};

/// Runs the program to its end, at most a minute: `arguments` begins with its path. It gets exactly this
/// environment ("NAME=value"), no input, and writes what it says into the file `output`.
ProgramRun RunProgram(const std::vector<std::string>& arguments, const std::vector<std::string>& environment,
                      const std::string& output);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_RUN_PROGRAM_H
