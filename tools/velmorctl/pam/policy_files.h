/// Where PAM policy files are, and how they are got at.
#ifndef VELMORCTL_PAM_POLICY_FILES_H
#define VELMORCTL_PAM_POLICY_FILES_H

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace velmorctl::pam {

/// The folders that libpam looks into for a service, in its order. Deliberate: files that are included are
/// looked for in the first one only, as libpam 1.5.2 does it.
inline constexpr const char* policyFolders[] = {"/etc/pam.d", "/usr/lib/pam.d"};

/// The service whose stacks stand in for those that a service does not have.
inline constexpr char otherService[] = "other";

/// Why a file cannot be read.
struct ReadingProblem {
  std::string reason;
  std::string remedy;
  std::size_t line = 0;  /// counted from 1; 0 when no line is to blame
  std::string value;     /// the text that is wrong; may be empty
};

struct FileReading {
  std::optional<std::string> content;
  std::optional<ReadingProblem> problem;  /// nothing when there is no such file
};

/// Reads the file of an absolute path below the root that is looked at. A folder reads as an empty file, as
/// it does for libpam; a link that leads nowhere is a problem.
using FileReader = std::function<FileReading(const std::string& path)>;

/// Whether the text can name a service: libpam cuts a name at its slashes, and "." and ".." are folders.
bool IsServiceName(const std::string& name);

/// The path of a file that a policy includes.
std::string IncludedPath(const std::string& name);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_POLICY_FILES_H
