/// The folder that stands for "/", so that the system in a mounted image can be edited like the running one.
#ifndef VELMORCTL_SYSTEM_FILE_ROOT_FOLDER_H
#define VELMORCTL_SYSTEM_FILE_ROOT_FOLDER_H

#include <sys/types.h>

#include <optional>
#include <string>

#include "command_line.h"

namespace velmorctl {

inline constexpr char circleRemedy[] = "mend the symbolic links, which lead in a circle";

/// Adds the option --root.
void AddRootOption(CLI::App& command, std::string& root);

/// A plain value; safe on any thread.
class RootFolder {
 public:
  /// Throws Failure (Usage) when there is no folder at the path.
  explicit RootFolder(const std::string& folder);

  /// Whether it is the running system's own root.
  bool IsHost() const { return folder_ == "/"; }

  /// The path on the running system of what is called `name`, an absolute path, inside the root. Symbolic
  /// links are followed inside the root, absolute ones too, and ".." ends at the root: the result is no link
  /// and never lies outside. What does not exist, or may not be looked at, is left as it is named, for the
  /// call that uses the path to report. Throws Failure (Configuration) for a circle of links.
  std::string Resolve(const std::string& name) const;

  /// The same; nothing for a circle of links.
  std::optional<std::string> Find(const std::string& name) const;

  /// Whether what is called `name` is a symbolic link itself, wherever it leads.
  bool IsLink(const std::string& name) const;

  /// Makes the folder `name` and those above it where they are missing, with this mode whatever the umask,
  /// durably, and returns its path on the running system. Throws Failure (Configuration).
  std::string MakeFolder(const std::string& name, mode_t mode) const;

  /// What follows a command that messages show, so that it works on this root: nothing for the host's own.
  std::string Option() const;

  /// `name` as messages show it: with the root in front, unless that is the host's own.
  std::string Shown(const std::string& name) const;

 private:
  std::string folder_;  // absolute; without a slash at its end, unless it is "/"
};

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_ROOT_FOLDER_H
