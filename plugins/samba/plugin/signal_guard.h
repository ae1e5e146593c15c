/// Keeps SIGPIPE away from the host process while a library writes to a socket.
#ifndef SAMBA_PLUGIN_SIGNAL_GUARD_H
#define SAMBA_PLUGIN_SIGNAL_GUARD_H

#include <signal.h>

namespace sambaprovider {

/// Blocks SIGPIPE in the calling thread while it exists, and takes one away that came meanwhile. A signal
/// that was pending before is left alone. Changes no handler.
class SigpipeGuard {
 public:
  SigpipeGuard();
  SigpipeGuard(const SigpipeGuard&) = delete;
  SigpipeGuard& operator=(const SigpipeGuard&) = delete;
  ~SigpipeGuard();

 private:
  sigset_t previous_;
  bool wasPending_;
};

}  // namespace sambaprovider

#endif  // SAMBA_PLUGIN_SIGNAL_GUARD_H
