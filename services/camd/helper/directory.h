// What the service asks of a domain controller.
#ifndef CAMD_HELPER_DIRECTORY_H
#define CAMD_HELPER_DIRECTORY_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "velmor/directory_connection.h"

namespace camd {

struct ComputerAccount {
  std::string dn;
  std::string sid;
  int64_t passwordSet = 0;  // in the directory's own unit; 0 when it was never set
  int64_t lastLogon = 0;    // as this controller saw it; others do not learn of it; 0 for never
  int64_t logonCount = 0;
  int64_t created = 0;  // seconds since 1970
  std::string owner;    // the identifier of who made it; empty when we may not see that
};

// The domain controllers that DNS names for the domain, best first. Throws Failure (kNoLogonServers) when it
// names none. Blocks as long as the resolver does.
std::vector<std::string> ControllersOf(const std::string& domain);

// The text of a binary security identifier ("S-1-5-..."). Throws Failure (kInternalError) for bytes that are
// none.
std::string SidText(const std::string& bytes);

// The same of the owner that a security descriptor names; empty when it names none.
std::string OwnerText(const std::string& descriptor);

// Its operations throw Failure as those of the connection do.
class Directory : public velmor::DirectoryConnection {
 public:
  using DirectoryConnection::DirectoryConnection;

  std::string DomainSid(const velmor::RootEntry& root);
  // The identifier of the user with this name; empty when there is none.
  std::string UserSid(const velmor::RootEntry& root, const std::string& user);
  // The account with this name, which is a valid computer name.
  std::optional<ComputerAccount> FindComputer(const velmor::RootEntry& root, const std::string& computer);
};

}  // namespace camd

#endif  // CAMD_HELPER_DIRECTORY_H
