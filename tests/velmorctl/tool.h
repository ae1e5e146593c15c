/// Running a program of the system, without a shell.
#ifndef VELMORCTL_TOOL_H
#define VELMORCTL_TOOL_H

#include <string>
#include <vector>

namespace velmorctltest {

struct ToolOutcome {
  int exitCode = -1;   /// -1 when a signal ended it
  std::string output;  /// what it wrote to standard output
};

/// Runs the program, whose name is the first argument and is looked for in PATH, to its end.
ToolOutcome RunTool(const std::vector<std::string>& arguments);

}  // namespace velmorctltest

#endif  // VELMORCTL_TOOL_H
