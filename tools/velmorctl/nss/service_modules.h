/// The shared objects behind the services.
#ifndef VELMORCTL_NSS_SERVICE_MODULES_H
#define VELMORCTL_NSS_SERVICE_MODULES_H

#include <string>
#include <vector>

#include "system_file/root_folder.h"

namespace velmorctl {

/// Looks for modules in the library folders of a root.
class ServiceModules {
 public:
  explicit ServiceModules(const RootFolder& root);

  const RootFolder& Root() const { return root_; }

  /// Whether the root has library folders at all; a tree of settings alone has none.
  bool CanTell() const { return !folders_.empty(); }

  /// Whether the C library finds the service: it is built in, or its module is there.
  bool Has(const std::string& service) const;

 private:
  RootFolder root_;
  std::vector<std::string> folders_;  // names inside the root
};

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_SERVICE_MODULES_H
