/// A host in the sandbox that is set up for the command, with the provider that follows a script.
#ifndef VELMORCTL_PREPARED_HOST_H
#define VELMORCTL_PREPARED_HOST_H

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "program.h"
#include "support/files.h"

namespace velmorctltest {

inline const std::string PASSWORD = "Tr0ub4dor-and-3";
inline const std::string PASSWORD_FILE = "/run/password";

/// The store "None" is active, the provider is "ctlscript", nothing is joined; PASSWORD_FILE holds the
/// password.
class PreparedHost : public ::testing::Test {
 protected:
  PreparedHost();

  /// Writes a file of the provider's script; see scripted_provider.c.
  static void Script(const std::string& name, const std::string& content);
  static void RemoveScript(const std::string& name);

  /// Whether the provider was called with this line, and all calls so far.
  static bool Called(const std::string& call);
  static std::vector<std::string> Calls();

  /// As after a join: the provider and the record say so.
  static void MakeJoined();

  /// The arguments of a join that succeeds unless the script says otherwise.
  static std::vector<std::string> Join(const std::string& target = "corp.example");

  static bool JoinedAtProvider();
  static std::string ActiveStore();
};

}  // namespace velmorctltest

#endif  // VELMORCTL_PREPARED_HOST_H
