/// pam-auth-update, which keeps the common-* files of Debian from profiles, tried out on a copy.
#ifndef VELMORCTL_PAM_EDIT_PROFILE_TOOL_H
#define VELMORCTL_PAM_EDIT_PROFILE_TOOL_H

#include <map>
#include <string>
#include <vector>

namespace velmorctl::pam {

inline constexpr char profileFolder[] = "/usr/share/pam-configs";
inline constexpr char profileStateFolder[] = "/var/lib/pam";

/// Contents of files by their names inside the root.
using FileContents = std::map<std::string, std::string>;

/// The policy files that the program writes, in its order.
const std::vector<std::string>& ProfileTargets();

/// Its record of what it has written, and of the profiles that it has offered.
const std::vector<std::string>& ProfileRecords();

/// What the program makes of `files` (profiles, targets, records) when it is run with `arguments`: targets
/// and records as it leaves them. It sees only a private copy with a database of answers of its own, so
/// nothing on the host changes, whatever it does. Takes at most a minute. Throws Failure when the program is
/// not there, or fails.
FileContents TryProfileTool(const FileContents& files, const std::vector<std::string>& arguments);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_PROFILE_TOOL_H
