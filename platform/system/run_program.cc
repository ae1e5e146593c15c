#include "system/run_program.h"

#include "system/system_error.h"
#include "velmor/run_program.h"

namespace HostMgmt::System {

void RunProgram(const std::vector<std::string>& arguments) {
  const velmor::ProgramEnd end =
      velmor::RunProgram({.arguments = arguments,
                          .environment = {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C"},
                          .output = "/dev/null",
                          .longestRun = std::chrono::seconds(30)});
  if (end.startError != 0) ThrowFileError("run", arguments.front(), end.startError);
  if (!end.failure.empty()) ThrowFileError("run", arguments.front(), end.failure);
}

}  // namespace HostMgmt::System
