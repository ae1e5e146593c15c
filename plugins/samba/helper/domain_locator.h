/// The domain controllers that DNS names for a domain.
#ifndef SAMBA_HELPER_DOMAIN_LOCATOR_H
#define SAMBA_HELPER_DOMAIN_LOCATOR_H

#include <string>
#include <vector>

namespace sambaprovider {

/// Returns the controllers of a domain from its SRV records, best first. Takes some ten seconds when no name
/// server answers. Throws Failure: kNoSuchDomain when the name servers know no such domain or refuse to say,
/// kNoLogonServers when they, which in such a domain are the controllers themselves, do not answer.
std::vector<std::string> LocateControllers(const std::string& dnsDomain);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_DOMAIN_LOCATOR_H
