/// Questions to one domain controller through LDAP.
#ifndef VELMOR_DIRECTORY_CONNECTION_H
#define VELMOR_DIRECTORY_CONNECTION_H

#include <ldap.h>

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace velmor {

/// What a controller tells anybody.
struct RootEntry {
  std::string controllerDnsName;
  std::string baseDn;
  std::string configurationDn;
  std::string currentTime;  /// for ParseGeneralizedTime
};

struct DirectoryEntry {
  std::string dn;
  std::map<std::string, std::string> values;  /// the first value of each attribute

  /// Empty when the entry has no such attribute, or does not show it to us.
  std::string Value(const std::string& attribute) const;
};

/// LDAP's "20261121010203.0Z" in seconds since 1970; nothing for another text.
std::optional<int64_t> ParseGeneralizedTime(const std::string& text);

/// A connection to one controller, a name or an address. Every operation waits for at most the time-out of
/// the constructor and throws Failure: 1311 when the controller does not answer, 5 when it grants no access,
/// 267 for what cannot be a name, else 1359. Not for use by several threads at once.
class DirectoryConnection {
 public:
  DirectoryConnection(const std::string& controller, std::chrono::seconds timeout);
  DirectoryConnection(DirectoryConnection&& other) noexcept;
  DirectoryConnection(const DirectoryConnection&) = delete;
  DirectoryConnection& operator=(const DirectoryConnection&) = delete;
  ~DirectoryConnection();

  /// Needs no log-on.
  RootEntry ReadRootEntry();

  /// Authenticates with the ticket that LogOn left and encrypts what follows.
  void Bind();

  /// The NetBIOS name of the controller's domain.
  std::string NetbiosName(const RootEntry& root);

  /// Whether there is an entry with this name that we may see.
  bool Exists(const std::string& dn);

  /// Deletes a computer account.
  void Delete(const std::string& dn);

 protected:
  /// The first entry that the filter matches, with these attributes; nothing when there is none or when the
  /// base does not exist. The list of controls, when there is one, ends with null.
  std::optional<DirectoryEntry> Find(const std::string& base, int scope, const std::string& filter,
                                     const std::vector<std::string>& attributes,
                                     LDAPControl** controls = nullptr);

 private:
  LDAP* connection_ = nullptr;
};

}  // namespace velmor

#endif  // VELMOR_DIRECTORY_CONNECTION_H
