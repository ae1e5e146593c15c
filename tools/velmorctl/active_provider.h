/// Which provider a system uses, and what its plug-in says of itself.
#ifndef VELMORCTL_ACTIVE_PROVIDER_H
#define VELMORCTL_ACTIVE_PROVIDER_H

#include "plugin_file.h"
#include "system_file/root_folder.h"

namespace velmorctl {

/// The provider that provider.conf inside the root names, as its plug-in on the running system describes it,
/// looked at in a child process. Deliberate: a plug-in inside another root is never loaded, since it would
/// run with the rights of this command. Throws Failure: ProviderUnusable when no provider is set or its
/// plug-in cannot be used, Configuration or NeedsRoot for a file that cannot be read.
PluginDescription ActiveProvider(const RootFolder& root);

}  // namespace velmorctl

#endif  // VELMORCTL_ACTIVE_PROVIDER_H
