/// What the provider remembers between calls, in one JSON file that holds no secret.
#ifndef SAMBA_COMMON_STATE_H
#define SAMBA_COMMON_STATE_H

#include <string>
#include <vector>

namespace sambaprovider {

struct State {
  bool joined = false;
  /// Empty unless joined.
  std::string dnsDomain;
  std::string netbiosDomain;
  std::string hostName;  // the short name that the host joined with, in capitals
  /// As it was at the join; empty after a join with a machine account until it has been looked up.
  std::string machineAccountDn;

  std::vector<std::string> preferredDomainControllers;
  std::vector<std::string> smartCardEnabledServices;
};

/// Throws Failure (kInternalError) for text that is not a state.
State ParseState(const std::string& text);
std::string FormatState(const State& state);

/// Reads the state file; a host without one has joined nothing. Throws Failure (kInternalError).
State LoadState();
/// Replaces the state file, readable by all. Throws Failure (kInternalError). Hold the OperationLock.
void SaveState(const State& state);

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_STATE_H
