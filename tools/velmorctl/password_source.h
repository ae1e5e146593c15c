/// Where a password comes from. No option and no environment variable takes one.
#ifndef VELMORCTL_PASSWORD_SOURCE_H
#define VELMORCTL_PASSWORD_SOURCE_H

#include <array>
#include <optional>
#include <string>

#include "command_line.h"
#include "secret.h"

namespace velmorctl {

/// The choice of the command line: a file, a descriptor, or (neither) the terminal.
struct PasswordSource {
  std::string file;
  std::optional<int> descriptor;

  /// Adds --password-file and --password-fd, which exclude each other, and returns both.
  std::array<CLI::Option*, 2> AddOptions(CLI::App& command);

  /// Reads the password of `userName`: one line, without its end. May wait for whoever writes it.
  /// Throws Failure when it cannot be read, is empty or holds a null character, or when the file can be read
  /// by everybody; and what ReadPasswordFromTerminal throws.
  void Read(const std::string& userName, Secret& password) const;
};

}  // namespace velmorctl

#endif  // VELMORCTL_PASSWORD_SOURCE_H
