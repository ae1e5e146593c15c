#include "nss/provider_service.h"

#include "active_provider.h"
#include "failure.h"
#include "nss/words.h"

namespace velmorctl {

ServiceMeaning ProviderService(const RootFolder& root) {
  const PluginDescription plugin = ActiveProvider(root);
  if (!IsServiceName(plugin.nssModule)) {
    throw Failure(ExitCode::ProviderUnusable, "the provider '" + plugin.name + "' names no service")
        .Detail("file", plugin.file)
        .Detail("value", plugin.nssModule)
        .Try("install the package that brings this plug-in again");
  }
  return {plugin.nssModule, SplitWords(plugin.nssModuleParameters)};
}

ServiceMeaning ServiceCalled(const std::string& name, const RootFolder& root) {
  try {
    ServiceMeaning service = ProviderService(root);
    if (service.name == name) {
      return service;
    }
  } catch (const Failure&) {
    // Services may be added on a host without a provider.
    return {name, {}};
  }
  return {name, {}};
}

SwitchEdit AddToAccountDatabases(const SwitchFile& file, const std::string& shown,
                                 const ServiceMeaning& service) {
  SwitchEdit edit = {file.Text(), {}};
  for (const char* database : {"passwd", "group", "initgroups"}) {
    const SwitchFile now(edit.content);
    if (database == std::string("initgroups") && now.LinesOf(database).empty()) {
      continue;
    }
    SwitchEdit next = AddService(now, shown, database, service, "");
    edit.content = std::move(next.content);
    edit.warnings.insert(edit.warnings.end(), next.warnings.begin(), next.warnings.end());
  }
  return edit;
}

}  // namespace velmorctl
