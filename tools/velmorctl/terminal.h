/// Asking for a password at the terminal.
#ifndef VELMORCTL_TERMINAL_H
#define VELMORCTL_TERMINAL_H

#include <string>

#include "secret.h"

namespace velmorctl {

/// Writes `prompt` to the controlling terminal and reads one line from it into `password`, without echo. The
/// terminal has its settings again when this returns or throws; also while the command is stopped with
/// Ctrl-Z, after which it asks again.
///
/// Throws Interrupted when a signal asks the command to end, and Failure when there is no terminal, when the
/// terminal ends before the line does, or when the line is too long.
void ReadPasswordFromTerminal(const std::string& prompt, Secret& password);

}  // namespace velmorctl

#endif  // VELMORCTL_TERMINAL_H
