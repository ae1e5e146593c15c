#include "pam/policy_files.h"

namespace velmorctl::pam {

bool IsServiceName(const std::string& name) {
  return !name.empty() && name != "." && name != ".." && name.find('/') == std::string::npos &&
         name.find('\0') == std::string::npos;
}

std::string IncludedPath(const std::string& name) {
  return name.starts_with('/') ? name : std::string(policyFolders[0]) + "/" + name;
}

}  // namespace velmorctl::pam
