/// From policy files to the stacks that libpam runs.
#ifndef VELMORCTL_PAM_RESOLVER_H
#define VELMORCTL_PAM_RESOLVER_H

#include <string>

#include "pam/policy_files.h"
#include "pam/stack.h"

namespace velmorctl::pam {

/// The stacks of the service as libpam 1.5.2 builds them, with what is wrong on the way as findings. The name
/// is taken in lower case, as libpam takes it. Never throws for what stands in the files; reads at most ten
/// thousand lines in all, includes counted each time, and reports a policy with more as Fatal.
Policy ResolvePolicy(const std::string& service, const FileReader& read);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_RESOLVER_H
