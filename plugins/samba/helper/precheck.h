/// The helper's side of velmor-samba-precheck.
#ifndef SAMBA_HELPER_PRECHECK_H
#define SAMBA_HELPER_PRECHECK_H

#include <string>
#include <vector>

#include "common/attempt_log.h"
#include "velmor/secret.h"

namespace sambaprovider {

/// An account of the domain and where to try it.
struct LogonRequest {
  std::string dnsDomain;
  std::vector<std::string> controllers;
  std::string user;
  const velmor::Secret& password;
  std::string computer;  // this host's computer name
};

/// What the directory holds.
struct Inspection {
  std::string controller;  // the one that answered
  std::string netbiosDomain;
  std::string organizationalUnitDn;  // empty when none was asked for
  std::string accountDn;             // empty when there is no computer account of this name
  std::string accountHostName;
};

/// Tries the password exactly once and looks at the directory. Records the steps "connect", "password" and
/// "clock", and "account" when it fails there. Throws Failure with the reason; kNoLogonServers also when
/// nothing came back in time.
Inspection Inspect(const AttemptLog& log, const LogonRequest& request, const std::string& organizationalUnit);

/// The DN of this host's computer account; empty when there is none. Throws Failure.
std::string FindAccountDn(const LogonRequest& request);

/// Removes this host's computer account when there is one. Returns what it did. Throws Failure.
std::string RemoveAccount(const LogonRequest& request);

}  // namespace sambaprovider

#endif  // SAMBA_HELPER_PRECHECK_H
