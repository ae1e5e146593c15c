/// What the pre-check asks of a domain controller.
#ifndef SAMBA_PRECHECK_DIRECTORY_H
#define SAMBA_PRECHECK_DIRECTORY_H

#include <string>

#include "velmor/directory_connection.h"

namespace sambaprovider {

struct ComputerAccount {
  std::string dn;  // empty when there is no such account
  std::string dnsHostName;
  bool isController = false;
};

/// Whether these flags, in decimal digits as LDAP gives them, are those of a domain controller's account.
bool IsControllersAccount(const std::string& userAccountControl);

/// Its operation throws Failure as those of the connection do.
class Directory : public velmor::DirectoryConnection {
 public:
  using DirectoryConnection::DirectoryConnection;

  /// The computer account with this short name.
  ComputerAccount FindComputer(const velmor::RootEntry& root, const std::string& computer);
};

}  // namespace sambaprovider

#endif  // SAMBA_PRECHECK_DIRECTORY_H
