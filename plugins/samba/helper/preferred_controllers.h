/// Making winbindd use the preferred domain controllers.
#ifndef SAMBA_HELPER_PREFERRED_CONTROLLERS_H
#define SAMBA_HELPER_PREFERRED_CONTROLLERS_H

#include "common/settings.h"
#include "common/state.h"

namespace sambaprovider {

/// Writes smb.conf for the state and has winbindd begin anew with it; nothing is to do for a host that has
/// joined no domain. winbindd remembers the controller that it used last and ignores the setting unless its
/// cache is emptied while it is stopped. Throws Failure: kHostConfigurationInTheWay when smb.conf is an
/// administrator's, which is left as it is.
void ApplyPreferredControllers(const State& state, const Settings& settings);

/// Has Samba forget which controllers it has used, and begin with the first preferred one, if there is one.
/// Call it while winbindd is stopped. Throws Failure.
void ForgetUsedControllers(const State& state);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_PREFERRED_CONTROLLERS_H
