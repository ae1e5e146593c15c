#include "pam_edit/module_line.h"

#include <algorithm>

namespace velmorctl::pam {

std::string ModuleText(const DirectoryModule& module, const std::string& more) {
  std::string text = module.name;
  for (const std::string& parameter : module.parameters) {
    text += " " + parameter;
  }
  return more.empty() ? text : text + " " + more;
}

std::string PasswordParameter(const DirectoryModule& module) {
  bool says =
      std::any_of(module.parameters.begin(), module.parameters.end(), [](const std::string& parameter) {
        return parameter == "try_first_pass" || parameter == "use_first_pass";
      });
  return says ? "" : "try_first_pass";
}

}  // namespace velmorctl::pam
