/// The command at a terminal.
#ifndef VELMORCTL_TERMINAL_SESSION_H
#define VELMORCTL_TERMINAL_SESSION_H

#include <sys/types.h>

#include <string>
#include <vector>

#include "program.h"

namespace velmorctltest {

/// Runs the command with a pseudo-terminal as its controlling terminal and all its standard descriptors, as a
/// shell does: a process that leads the session starts it in the foreground, and waits for it.
class TerminalSession {
 public:
  explicit TerminalSession(const std::vector<std::string>& arguments);
  TerminalSession(const TerminalSession&) = delete;
  TerminalSession& operator=(const TerminalSession&) = delete;
  ~TerminalSession();

  /// Reads from the terminal until `text` has been shown; false when that takes too long.
  bool AwaitText(const std::string& text);

  /// Presses keys.
  void Type(const std::string& keys) const;

  pid_t Process() const { return process_; }

  /// Whether the terminal shows what is typed.
  bool Echoes() const;

  /// Waits until the command has been stopped by a signal; false when it ended instead.
  bool AwaitStop();
  void Signal(int number) const;

  /// Waits for the end; `output` is everything that was shown, `errors` is empty.
  Outcome Wait();

 private:
  void ReadShown(int timeoutMilliseconds);
  int ReadReport();

  int master_;
  int terminal_;
  int reports_;  /// from the leader: the command's process number, then its wait statuses
  pid_t leader_;
  pid_t process_;
  std::string shown_;
};

}  // namespace velmorctltest

#endif  // VELMORCTL_TERMINAL_SESSION_H
