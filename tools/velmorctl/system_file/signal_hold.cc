#include "system_file/signal_hold.h"

#include <initializer_list>

namespace velmorctl {

SignalHold::SignalHold() : previous_() {
  sigset_t held;
  sigemptyset(&held);
  for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
    sigaddset(&held, number);
  }
  pthread_sigmask(SIG_BLOCK, &held, &previous_);
}

SignalHold::~SignalHold() {
  pthread_sigmask(SIG_SETMASK, &previous_, nullptr);
}

}  // namespace velmorctl
