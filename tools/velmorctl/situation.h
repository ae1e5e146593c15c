/// What the command is doing, for the report of a failure.
#ifndef VELMORCTL_SITUATION_H
#define VELMORCTL_SITUATION_H

#include <optional>
#include <string>
#include <vector>

#include "exit_codes.h"

namespace velmorctl {

/// Kept up to date by the command as it goes along, and read by main() when something is thrown.
class Situation {
 public:
  /// What is being done, as the end of "cannot ...".
  std::string doing;

  /// The code for a failure of the host platform's files.
  ExitCode platformFailure = ExitCode::HostNotReady;

  /// Why the provider failed, in its own words; empty when it did not say.
  std::string providerReason;

  /// Whether the CAM service is asked: then its statuses count, unless the provider gave a reason of its own.
  bool throughProxy = false;

  /// Remembers a digest of the file, so that Changes() can tell whether the command changed it. Files of more
  /// than a mebibyte are not looked at.
  void Watch(const std::string& file);

  /// Adds a change that stays, in words.
  void AddChange(const std::string& change);

  /// Takes back the changes that were added, since they were undone.
  void ForgetChanges();

  /// Everything that is different from before.
  std::vector<std::string> Changes() const;

 private:
  struct WatchedFile {
    std::string file;
    std::optional<std::string> digest;
  };
  std::vector<WatchedFile> files_;
  std::vector<std::string> changes_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_SITUATION_H
