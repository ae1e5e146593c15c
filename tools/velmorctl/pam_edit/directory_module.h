/// The PAM module of the provider in use, as its plug-in names it.
#ifndef VELMORCTL_PAM_EDIT_DIRECTORY_MODULE_H
#define VELMORCTL_PAM_EDIT_DIRECTORY_MODULE_H

#include <string>
#include <vector>

#include "system_file/root_folder.h"

namespace velmorctl::pam {

struct DirectoryModule {
  std::string provider;
  std::string name;  /// as it is written into a policy file
  std::vector<std::string> parameters;
};

/// The module of the provider that provider.conf inside the root names. Throws Failure when there is none,
/// its plug-in cannot be used, or what it says cannot stand in a policy file.
DirectoryModule ReadDirectoryModule(const RootFolder& root);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_EDIT_DIRECTORY_MODULE_H
