// What systemd wants to know of a service of type "notify".
#ifndef CAMD_SERVICE_SYSTEM_MANAGER_H
#define CAMD_SERVICE_SYSTEM_MANAGER_H

namespace camd {

// Tells the system manager that the service answers, or that it is ending. Does nothing when none asked to be
// told ($NOTIFY_SOCKET), and writes to the system log when it cannot be reached.
void TellReady();
void TellStopping();

}  // namespace camd

#endif  // CAMD_SERVICE_SYSTEM_MANAGER_H
