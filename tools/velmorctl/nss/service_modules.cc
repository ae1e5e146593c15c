#include "nss/service_modules.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <optional>
#include <system_error>

#include "system_file/file_calls.h"

namespace velmorctl {

namespace {

constexpr const char* libraryFolders[] = {"/lib", "/lib64", "/usr/lib", "/usr/lib64"};

}  // namespace

ServiceModules::ServiceModules(const RootFolder& root) : root_(root) {
  for (const std::string folder : libraryFolders) {
    const std::optional<std::string> path = root_.Find(folder);
    if (!path || !IsFolder(*path)) {
      continue;
    }
    folders_.push_back(folder);
    // Where several architectures share a system, each has a folder such as x86_64-linux-gnu.
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(*path, error)) {
      const std::string name = entry.path().filename();
      if (name.find("-linux-") != std::string::npos) {
        folders_.push_back(folder + "/" + name);
      }
    }
  }
}

bool ServiceModules::Has(const std::string& service) const {
  if (service == "files" || service == "dns") {
    return true;
  }
  return std::any_of(folders_.begin(), folders_.end(), [&](const std::string& folder) {
    const std::optional<std::string> path = root_.Find(folder + "/libnss_" + service + ".so.2");
    return path && access(path->c_str(), F_OK) == 0;
  });
}

}  // namespace velmorctl
