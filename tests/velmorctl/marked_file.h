/// Extended attributes of a file, as a mark that a replacement has to keep.
#ifndef VELMORCTL_MARKED_FILE_H
#define VELMORCTL_MARKED_FILE_H

#include <sys/xattr.h>

#include <string>

namespace velmorctltest {

/// "user." attributes are not known to every kernel's memory file system, "security." ones are not allowed in
/// a user namespace; one of the two can be set.
inline constexpr const char* markNames[] = {"user.velmorctl_test", "security.velmorctl_test"};

/// Sets the mark; false when none can be set.
inline bool Mark(const std::string& path, const std::string& value) {
  for (const char* name : markNames) {
    if (setxattr(path.c_str(), name, value.data(), value.size(), 0) == 0) {
      return true;
    }
  }
  return false;
}

/// The mark of the file; empty when it has none.
inline std::string MarkOf(const std::string& path) {
  for (const char* name : markNames) {
    char value[64];
    const ssize_t size = getxattr(path.c_str(), name, value, sizeof value);
    if (size >= 0) {
      return {value, static_cast<std::size_t>(size)};
    }
  }
  return {};
}

}  // namespace velmorctltest

#endif  // VELMORCTL_MARKED_FILE_H
