/// What a failure means while the CAM service is asked.
#ifndef VELMORCTL_PROXY_MEANINGS_H
#define VELMORCTL_PROXY_MEANINGS_H

#include <exception>

#include "meanings.h"

namespace velmorctl {

/// As MeaningOf, for a failure that the CAM service, its plug-in or the way to it is the cause of. The same
/// codes mean something else there: 5 is a host that the service does not know, not a user without rights.
const Meaning& ProxyMeaningOf(const std::exception& exception);

}  // namespace velmorctl

#endif  // VELMORCTL_PROXY_MEANINGS_H
