/// Policy files in memory.
#ifndef VELMORCTL_TEST_POLICY_SET_H
#define VELMORCTL_TEST_POLICY_SET_H

#include <filesystem>
#include <map>
#include <string>

#include "pam/policy_files.h"

namespace velmorctltest {

/// The files by name: an absolute path, or a name in /etc/pam.d.
using PolicySet = std::map<std::string, std::string>;

/// Reads from the set, which must live as long as the reader.
inline velmorctl::pam::FileReader ReaderOf(const PolicySet& files) {
  return [&files](const std::string& name) -> velmorctl::pam::FileReading {
    const std::string path = std::filesystem::path(name).lexically_normal();
    const std::string folder = "/etc/pam.d/";
    auto found = files.find(path);
    if (found == files.end() && path.starts_with(folder)) {
      found = files.find(path.substr(folder.size()));
    }
    if (path == folder) {
      return {"", velmorctl::pam::ReadingProblem{"it is a folder", "put a file there", 0, ""}};
    }
    return found == files.end() ? velmorctl::pam::FileReading()
                                : velmorctl::pam::FileReading{found->second, std::nullopt};
  };
}

}  // namespace velmorctltest

#endif  // VELMORCTL_TEST_POLICY_SET_H
