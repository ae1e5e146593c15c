/// Waiting for a call that cannot be cut short, while time and signals pass.
#ifndef VELMORCTL_WATCHED_CALL_H
#define VELMORCTL_WATCHED_CALL_H

#include <exception>
#include <functional>
#include <optional>
#include <string>

#include "progress.h"
#include "signal_pipe.h"

namespace velmorctl {

struct CallOutcome {
  std::exception_ptr failure;       /// what the call threw, or null
  std::optional<int> signalNumber;  /// the signal that asked the command to end meanwhile
};

/// Runs `call` on a thread of its own and shows the progress until it ends. The first signal is answered with
/// the line `onSignal` and remembered. A second one throws Interrupted at once; the call then goes on, so
/// everything that it uses must belong to it.
CallOutcome RunWatched(std::function<void()> call, Progress& progress, SignalPipe& signals,
                       const std::string& onSignal);

}  // namespace velmorctl

#endif  // VELMORCTL_WATCHED_CALL_H
