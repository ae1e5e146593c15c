/// Questions to one domain controller through LDAP.
#ifndef SAMBA_PRECHECK_DIRECTORY_H
#define SAMBA_PRECHECK_DIRECTORY_H

#include <ldap.h>

#include <chrono>
#include <cstdint>
#include <string>

namespace sambaprovider {

/// What a controller tells anybody.
struct RootEntry {
  std::string controllerDnsName;
  std::string baseDn;
  std::string configurationDn;
  int64_t currentTime = 0;  // seconds since 1970
};

struct ComputerAccount {
  std::string dn;  // empty when there is no such account
  std::string dnsHostName;
  bool isController = false;
};

/// Whether these flags, in decimal digits as LDAP gives them, are those of a domain controller's account.
bool IsControllersAccount(const std::string& userAccountControl);

/// Parses LDAP's "20261121010203.0Z" to seconds since 1970. Throws Failure (kInternalError).
int64_t ParseGeneralizedTime(const std::string& text);

/// A connection to one controller. Every operation waits for at most the time-out of the constructor and
/// throws Failure with kNoLogonServers when the controller does not answer. Not for use by several threads at
/// once.
class Directory {
 public:
  Directory(const std::string& controller, std::chrono::seconds timeout);
  Directory(const Directory&) = delete;
  Directory& operator=(const Directory&) = delete;
  ~Directory();

  /// Needs no log-on.
  RootEntry ReadRootEntry();

  /// Authenticates with the ticket that LogOn left and encrypts what follows.
  void Bind();

  /// The domain's NetBIOS name.
  std::string NetbiosName(const RootEntry& root);
  /// The computer account with this short name.
  ComputerAccount FindComputer(const RootEntry& root, const std::string& computer);
  /// Whether an entry exists. Throws Failure (kInvalidOrganizationalUnit) when `dn` cannot be a name.
  bool Exists(const std::string& dn);
  void Delete(const std::string& dn);

 private:
  LDAP* connection_ = nullptr;
};

}  // namespace sambaprovider

#endif  // SAMBA_PRECHECK_DIRECTORY_H
