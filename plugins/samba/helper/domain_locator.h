/// The domain controllers that DNS names for a domain.
#ifndef SAMBA_HELPER_DOMAIN_LOCATOR_H
#define SAMBA_HELPER_DOMAIN_LOCATOR_H

#include <string>
#include <vector>

#include "common/attempt_log.h"

namespace sambaprovider {

/// Returns the controllers of a domain from its SRV records, best first. Takes some ten seconds when no name
/// server answers. Throws Failure: kNoSuchDomain when the name servers know no such domain or refuse to say,
/// kNoLogonServers when they, which in such a domain are the controllers themselves, do not answer.
std::vector<std::string> LocateControllers(const std::string& dnsDomain);

/// In which order they are tried: the first two preferred ones, then those that DNS names. No more than two,
/// since only some are tried at all, and preferred ones may be gone or serve another domain.
std::vector<std::string> ControllersInTurn(const std::vector<std::string>& preferred,
                                           const std::vector<std::string>& located);

/// Records the step "locate". Throws Failure as LocateControllers() does.
std::vector<std::string> ControllersToTry(const AttemptLog& log, const std::string& dnsDomain,
                                          const std::vector<std::string>& preferred);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_DOMAIN_LOCATOR_H
