/// Running a program of the system to its end, without a shell.
#ifndef VELMOR_RUN_PROGRAM_H
#define VELMOR_RUN_PROGRAM_H

#include <chrono>
#include <string>
#include <vector>

namespace velmor {

struct Program {
  std::vector<std::string> arguments;    /// begins with the program's absolute path
  std::vector<std::string> environment;  /// "NAME=value"; the program gets no other
  std::string output;                    /// the file that takes what it writes; made when it is missing
  std::chrono::seconds longestRun;
};

struct ProgramEnd {
  int startError = 0;   /// the error number when the program could not be started, else 0
  std::string failure;  /// in words, how it ended; empty after status 0
};

/// Waits for the program's end; what runs too long is killed, with all that it started in its process group.
/// The program gets no input, none of our descriptors, and no signal that is blocked or ignored. Where this
/// process ignores SIGCHLD or collects each child itself, how the program ended is not known, and counts as
/// status 0. Safe on any thread.
ProgramEnd RunProgram(const Program& program);

}  // namespace velmor

#endif  // VELMOR_RUN_PROGRAM_H
