/// The library's key-value files, as the command looks at them and writes them.
#ifndef VELMORCTL_SETTINGS_FILE_H
#define VELMORCTL_SETTINGS_FILE_H

#include <map>
#include <optional>
#include <string>

#include "file_problem.h"

namespace velmorctl {

inline constexpr char authenticationFile[] = "/etc/quenix/velmor/authentication.conf";
inline constexpr char providerFile[] = "/etc/quenix/velmor/provider.conf";
inline constexpr char storeKey[] = "remote-authentication-store";
inline constexpr char providerKey[] = "provider";

struct SettingsInspection {
  std::string value;  /// of the key; empty when the file does not have it
  std::optional<FileProblem> problem;
};

/// Looks at the file at `path`, which must set `key`; `example` is a good line for it. Finds the first thing
/// that the library refuses (file missing or unreadable, a line without "=", a part that is one quote alone,
/// no such key), and what it takes as it stands though nobody means it (no value, quotes that do not match, a
/// carriage return at the line's end).
SettingsInspection InspectSettingsFile(const std::string& path, const std::string& key,
                                       const std::string& example);

/// The same for authentication.conf, whose store must be one that the library has.
SettingsInspection InspectAuthenticationFile();

/// The same for provider.conf.
SettingsInspection InspectProviderFile();

/// Replaces the file by the entries, in the library's format: durably, and at once for every reader. Owner,
/// permissions and attributes stay, and so does a link in the file's place; a new file can be read by
/// everybody, since nothing in it is secret. Makes the directory when it is missing. Throws Failure; the file
/// is then as it was.
void ReplaceSettingsFile(const std::string& path, const std::map<std::string, std::string>& entries);

}  // namespace velmorctl

#endif  // VELMORCTL_SETTINGS_FILE_H
