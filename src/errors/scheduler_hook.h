/// The host's own scheduler, when it has installed one.
#ifndef ERRORS_SCHEDULER_HOOK_H
#define ERRORS_SCHEDULER_HOOK_H

#include <functional>

namespace quenix::authentication {

/// Empty until VelmorThreadUtil::SetScheduler(); no lock guards it. See process_wide.cc.
extern std::function<void(std::function<void()>)>& schedulerHook;

}  // namespace quenix::authentication

#endif  // ERRORS_SCHEDULER_HOOK_H
