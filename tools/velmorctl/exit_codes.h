/// The exit codes of the command; velmorctl(8) documents them.
#ifndef VELMORCTL_EXIT_CODES_H
#define VELMORCTL_EXIT_CODES_H

#include <span>
#include <string_view>

namespace velmorctl {

enum class ExitCode : int {
  Fine = 0,
  Other = 1,
  Usage = 2,
  NotJoined = 3,
  TrustBroken = 4,
  FromCache = 5,
  CredentialsRefused = 6,
  HostNotReady = 7,
  DomainNotReachable = 8,
  ProviderUnusable = 9,
  Conflict = 10,
  Configuration = 11,
  Proxy = 12,
  Difference = 13,
  NeedsRoot = 77
};

struct ExitCodeMeaning {
  ExitCode code;
  std::string_view meaning;
};

/// Every exit code with its meaning, in ascending order.
std::span<const ExitCodeMeaning> ExitCodeMeanings();

}  // namespace velmorctl

#endif  // VELMORCTL_EXIT_CODES_H
