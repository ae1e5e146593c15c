/// Having the helper do what changes the host.
#ifndef SAMBA_PLUGIN_HELPER_CLIENT_H
#define SAMBA_PLUGIN_HELPER_CLIENT_H

#include "common/message.h"

namespace sambaprovider {

/// Runs one operation of the helper and returns when it has succeeded. The request's "operation" names it;
/// the rest is the operation's. Throws Failure with its status: kBusy when this process has one running that
/// does not end within seconds, kTimedOut when it was ended at the deadline of the settings, kHelperDied when
/// it crashed. After the last two the helper is started once more to put right what was left. May block for
/// the operation's deadline and a minute more. Safe to be called from several threads.
void RunHelper(Request request);

}  // namespace sambaprovider

#endif  // SAMBA_PLUGIN_HELPER_CLIENT_H
