/// Asking the real libpam.
#ifndef VELMORCTL_TEST_REAL_LIBPAM_H
#define VELMORCTL_TEST_REAL_LIBPAM_H

#include <string>
#include <vector>

#include "pam/simulator.h"
#include "policy_set.h"

namespace velmorctltest {

/// What a program gets from libpam, and which calls the scripted module got on the way.
struct Protocol {
  /// "start=abort", or one line for each operation: "pam_authenticate=success", and for each call of the
  /// module its operation and arguments.
  std::vector<std::string> lines;

  bool operator==(const Protocol&) const = default;
};

std::ostream& operator<<(std::ostream& stream, const Protocol& protocol);

/// One call of the scripted module.
std::string CallLine(const std::string& operation, const std::vector<std::string>& arguments);

/// The operation as the scripted module calls it.
std::string ScriptName(velmorctl::pam::Operation operation);

/// Puts the files into /etc/pam.d of the sandbox, where no others are, and runs the operations on the service
/// "svc", those of a change of password in one call. Ends with the first answer "incomplete".
Protocol AskLibpam(const PolicySet& files, const std::vector<velmorctl::pam::Operation>& operations);

/// Whether libpam brings down a process that starts the service "svc", or keeps it busy for a second of
/// processor time.
bool LibpamCrashesOrHangs(const PolicySet& files);

}  // namespace velmorctltest

#endif  // VELMORCTL_TEST_REAL_LIBPAM_H
