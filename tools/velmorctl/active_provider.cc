#include "active_provider.h"

#include "failure.h"
#include "settings_file.h"

namespace velmorctl {

PluginDescription ActiveProvider(const RootFolder& root) {
  SettingsInspection settings =
      InspectSettingsFile(root.Resolve(providerFile), providerKey, std::string(providerKey) + " = \"samba\"");
  if (settings.problem) {
    const bool noProvider = settings.problem->kind == FileProblem::Kind::Missing ||
                            settings.problem->kind == FileProblem::Kind::NoValue;
    throw AsFailure(*settings.problem, noProvider ? ExitCode::ProviderUnusable : ExitCode::Configuration,
                    "the provider is not known");
  }
  if (!IsProviderName(settings.value)) {
    throw Failure(ExitCode::ProviderUnusable, "the provider's name cannot be one")
        .Detail("file", root.Shown(providerFile))
        .Detail("value", settings.value)
        .Try("velmorctl provider use samba (\"velmorctl provider list\" shows the providers)");
  }
  PluginDescription plugin = InspectProvider(settings.value);
  if (plugin.problem) {
    throw AsFailure(*plugin.problem, ExitCode::ProviderUnusable,
                    "the provider '" + settings.value + "' cannot be used");
  }
  return plugin;
}

}  // namespace velmorctl
