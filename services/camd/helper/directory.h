// Questions to one domain controller through LDAP.
#ifndef CAMD_HELPER_DIRECTORY_H
#define CAMD_HELPER_DIRECTORY_H

#include <ldap.h>

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace camd {

// What a controller tells anybody.
struct RootEntry {
  std::string controller;
  std::string baseDn;
  std::string configurationDn;
};

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

// A connection to one controller. Every operation waits for at most the time-out of the constructor and
// throws Failure: kNoLogonServers when the controller does not answer, kAccessDenied, kInvalidContainer,
// kInternalError. Not for use by several threads at once.
class Directory {
 public:
  Directory(const std::string& controller, std::chrono::seconds timeout);
  Directory(Directory&& other) noexcept;
  Directory(const Directory&) = delete;
  Directory& operator=(const Directory&) = delete;
  ~Directory();

  // Needs no log-on.
  RootEntry ReadRootEntry();
  // Authenticates with the ticket that LogOn left and encrypts what follows.
  void Bind();

  std::string NetbiosName(const RootEntry& root);
  std::string DomainSid(const RootEntry& root);
  // The identifier of the user with this name; empty when there is none.
  std::string UserSid(const RootEntry& root, const std::string& user);
  // The account with this name, which is a valid computer name.
  std::optional<ComputerAccount> FindComputer(const RootEntry& root, const std::string& computer);
  bool Exists(const std::string& dn);
  void Delete(const std::string& dn);

 private:
  LDAP* connection_ = nullptr;
};

}  // namespace camd

#endif  // CAMD_HELPER_DIRECTORY_H
