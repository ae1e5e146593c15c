/// Signals as data that can be waited for beside other descriptors.
#ifndef VELMORCTL_SIGNAL_PIPE_H
#define VELMORCTL_SIGNAL_PIPE_H

#include <signal.h>

#include <initializer_list>
#include <optional>
#include <utility>
#include <vector>

namespace velmorctl {

/// While it lives, the given signals end nothing: each is put into a pipe, whichever thread it reaches. A
/// signal that the process was started to ignore stays ignored. Programs that are started meanwhile get the
/// usual dispositions. Only one object may exist at a time.
class SignalPipe {
 public:
  /// Throws std::system_error when the pipe cannot be made.
  SignalPipe(std::initializer_list<int> signalNumbers);
  SignalPipe(const SignalPipe&) = delete;
  SignalPipe& operator=(const SignalPipe&) = delete;

  /// Restores the dispositions of before.
  ~SignalPipe();

  /// Readable while a signal waits to be taken.
  int Descriptor() const noexcept { return readEnd_; }

  /// The oldest signal that waits, or nothing; does not block.
  std::optional<int> Take();

 private:
  int readEnd_;
  std::vector<std::pair<int, struct sigaction>> previousActions_;
};

/// Lets nobody who stops reading what the command writes break it off.
void IgnoreBrokenPipes();

}  // namespace velmorctl

#endif  // VELMORCTL_SIGNAL_PIPE_H
