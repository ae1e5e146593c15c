/// Starting and stopping winbindd: through systemd where that runs, else directly.
#ifndef SAMBA_HELPER_WINBIND_SERVICE_H
#define SAMBA_HELPER_WINBIND_SERVICE_H

namespace sambaprovider::winbind_service {

/// Throws Failure (kServiceNotInstalled) when the program is absent.
void RequireInstalled();

bool IsRunning();

/// Starts winbindd and waits until it answers. Throws Failure (kServiceNotActive) when it does not within
/// some seconds, with its own last words where they are known.
void Start();

/// Ends winbindd when it runs and waits for its end. Throws Failure (kServiceNotActive) when it stays.
void Stop();

/// Forgets which controllers winbindd has used. Call it while winbindd is stopped.
void FlushCache();

}  // namespace sambaprovider::winbind_service

#endif  // SAMBA_HELPER_WINBIND_SERVICE_H
