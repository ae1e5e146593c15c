/// Keeping a signal from ending a change half way.
#ifndef VELMORCTL_SYSTEM_FILE_SIGNAL_HOLD_H
#define VELMORCTL_SYSTEM_FILE_SIGNAL_HOLD_H

#include <signal.h>

namespace velmorctl {

/// While it lives, SIGINT, SIGTERM, SIGHUP and SIGQUIT wait; what has come meanwhile acts afterwards. For the
/// calling thread, which must be the only one.
class SignalHold {
 public:
  SignalHold();
  SignalHold(const SignalHold&) = delete;
  SignalHold& operator=(const SignalHold&) = delete;
  ~SignalHold();

 private:
  sigset_t previous_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_SIGNAL_HOLD_H
