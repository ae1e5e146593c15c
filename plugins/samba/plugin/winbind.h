/// Questions to winbindd. Each call uses a connection of its own, so threads need not know of each other. How
/// long one may block is winbindd's own request time-out.
#ifndef SAMBA_PLUGIN_WINBIND_H
#define SAMBA_PLUGIN_WINBIND_H

#include <cstdint>
#include <string>
#include <vector>

extern "C" {
#include <wbclient.h>
}

#include "common/names.h"

namespace sambaprovider::winbind {

/// Whether winbindd runs at all.
bool Answers();

struct TrustCheck {
  wbcErr error = WBC_ERR_SUCCESS;
  uint32_t ntStatus = 0;  // meaningful with WBC_ERR_AUTH_ERROR
};

/// Has the domain accept the machine's password anew.
TrustCheck CheckTrust(const std::string& netbiosDomain);

struct TrustedDomain {
  std::string dnsName;
  std::string netbiosName;
  uint32_t flags = 0;  // WBC_DOMINFO_TRUST_...
  bool online = false;
};

/// Whether this may be the list of a winbindd that has not asked a controller for the trusted domains since
/// it was started, so that nothing follows from what is missing in it. That of a domain without trusts whose
/// controllers do not answer looks the same.
bool IsBeforeLearning(const std::vector<TrustedDomain>& domains);

/// All domains but the host's own set of accounts and BUILTIN; the joined domain is among them. Waits some
/// seconds for a winbindd that has just been started. Throws Failure: kServiceNotActive when winbindd does
/// not run, kNoLogonServers when it runs and has no answer.
std::vector<TrustedDomain> ListDomains();

/// A controller's DNS name. `site` may be empty. Throws Failure: kNoSuchDomain, and as ListDomains.
std::string FindController(const std::string& dnsDomain, const std::string& site);

/// The account's name as the directory writes it, "DOMAIN\name". Throws Failure: kNoSuchUser, and as
/// ListDomains.
std::string CanonicalName(const AccountName& account);

}  // namespace sambaprovider::winbind

#endif  // SAMBA_PLUGIN_WINBIND_H
