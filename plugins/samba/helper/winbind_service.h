/// Starting and stopping winbindd: through systemd where that runs, else directly.
#ifndef SAMBA_HELPER_WINBIND_SERVICE_H
#define SAMBA_HELPER_WINBIND_SERVICE_H

#include <string>
#include <vector>

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

/// Has winbindd begin with this controller of the domain, which is known by any of the names, when it is
/// started next; a domain that cannot be reached there is looked for at the others. Without this the order in
/// smb.conf is a head start only: several controllers are asked at once, and a quick one is taken. Call it
/// after FlushCache().
void BeginWith(const std::string& controller, const std::vector<std::string>& domainNames);

}  // namespace sambaprovider::winbind_service

#endif  // SAMBA_HELPER_WINBIND_SERVICE_H
