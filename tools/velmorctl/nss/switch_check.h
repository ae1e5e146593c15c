/// Finding what is wrong in a name-service switch file.
#ifndef VELMORCTL_NSS_SWITCH_CHECK_H
#define VELMORCTL_NSS_SWITCH_CHECK_H

#include <string>
#include <vector>

#include "file_problem.h"
#include "nss/service_modules.h"
#include "nss/switch_file.h"

namespace velmorctl {

/// What the C library reads otherwise than it looks, or what keeps accounts from being found; in the order of
/// the lines. `shown` names the file.
std::vector<FileProblem> CheckSwitchFile(const SwitchFile& file, const std::string& shown,
                                         const ServiceModules& modules);

}  // namespace velmorctl

#endif  // VELMORCTL_NSS_SWITCH_CHECK_H
