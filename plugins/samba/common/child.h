/// Child processes of the plug-in and of its helper: started without a shell, with nothing of ours open in
/// them, and ended at a deadline.
///
/// Safe in a foreign process with threads: no signal handler, no change of the environment, no SIGPIPE, and
/// no reliance on being the one who collects the child.
#ifndef SAMBA_COMMON_CHILD_H
#define SAMBA_COMMON_CHILD_H

#include <chrono>
#include <string>
#include <string_view>
#include <vector>

namespace sambaprovider {

/// Whether a child leads a session of its own, so that it can be ended with all its children.
enum class ChildGroup { kOwn, kCallers };

/// Which environment a child gets.
enum class ChildEnvironment { kMinimal, kCallers };

struct Conversation {
  enum class End {
    kAnswered,  // `answer` is a whole line, without its end
    kDied,      // the child ended, or closed its side, before it had answered
    kDeadline,  // it was ended because the time was over
  };
  End end = End::kDied;
  std::string answer;
};

/// Starts the program `path` with one socket as its standard input and output, sends it one line and
/// `secret`, and waits for one line. Has collected the child when it returns. Takes at most `limit` and a few
/// seconds. Throws Failure (kInternalError) when the program cannot be started.
Conversation Converse(const std::string& path, ChildGroup group, ChildEnvironment environment,
                      const std::string& line, std::string_view secret, std::chrono::milliseconds limit);

struct ProgramResult {
  bool timedOut = false;
  int exitStatus = -1;  // -1 when it ended by a signal or at the deadline
  std::string output;   // standard output and errors; when it is very long, its end
};

/// The last line that is not blank.
std::string LastLine(const std::string& text);

/// Whether a program's output is wanted; a program that leaves a daemon behind must have none.
enum class ProgramOutput { kWanted, kDropped };

/// Runs a program of the system to its end, in the caller's process group and environment, with no input.
/// Throws Failure (kInternalError) when it cannot be started.
ProgramResult RunProgram(const std::vector<std::string>& command, ProgramOutput output,
                         std::chrono::milliseconds limit);

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_CHILD_H
