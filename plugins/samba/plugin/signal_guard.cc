#include "plugin/signal_guard.h"

#include <cerrno>
#include <ctime>

namespace sambaprovider {
namespace {

sigset_t OnlySigpipe() {
  sigset_t set;
  sigemptyset(&set);
  sigaddset(&set, SIGPIPE);
  return set;
}

bool SigpipeIsPending() {
  sigset_t pending;
  sigpending(&pending);
  return sigismember(&pending, SIGPIPE) == 1;
}

}  // namespace

SigpipeGuard::SigpipeGuard() : wasPending_(SigpipeIsPending()) {
  const sigset_t set = OnlySigpipe();
  pthread_sigmask(SIG_BLOCK, &set, &previous_);
}

SigpipeGuard::~SigpipeGuard() {
  const int savedError = errno;
  if (!wasPending_) {
    const sigset_t set = OnlySigpipe();
    const timespec noWait = {};
    while (sigtimedwait(&set, nullptr, &noWait) < 0 && errno == EINTR) {
    }
  }
  pthread_sigmask(SIG_SETMASK, &previous_, nullptr);
  errno = savedError;
}

}  // namespace sambaprovider
