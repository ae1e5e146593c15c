#include "nss/provider_service.h"

#include <optional>

#include "active_provider.h"
#include "failure.h"
#include "nss/criterion.h"
#include "nss/words.h"
#include "text.h"

namespace velmorctl {

namespace {

Failure BadPlugin(const PluginDescription& plugin, const std::string& happened, const std::string& value) {
  return Failure(ExitCode::ProviderUnusable, "the provider '" + plugin.name + "' " + happened)
      .Detail("file", plugin.file)
      .Detail("value", Printable(value))
      .Try("install the package that brings this plug-in again");
}

std::string AsWarning(const std::string& database, const Failure& refusal) {
  std::string warning = "\"" + database + "\" stays as it is: " + refusal.what();
  for (const Failure::NamedDetail& detail : refusal.Details()) {
    warning += "; " + detail.name + ": " + detail.value;
  }
  return warning + "; try: " + refusal.Advice();
}

}  // namespace

ServiceMeaning ProviderService(const RootFolder& root) {
  const PluginDescription plugin = ActiveProvider(root);
  if (!IsServiceName(plugin.nssModule)) {
    throw BadPlugin(plugin, "names no service", plugin.nssModule);
  }
  ServiceMeaning service = {plugin.nssModule, SplitWords(plugin.nssModuleParameters)};
  // Brackets that it cannot read make the C library use no line of the whole file.
  if (!service.criterion.empty() && !ParseCriterion(plugin.nssModuleParameters)) {
    throw BadPlugin(plugin, "has parameters for its service that the C library does not know",
                    plugin.nssModuleParameters);
  }
  return service;
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
  std::optional<Failure> refusal;
  for (const char* database : {"passwd", "group", "initgroups"}) {
    const SwitchFile now(edit.content);
    if (database == std::string("initgroups") && now.LinesOf(database).empty()) {
      continue;
    }
    try {
      SwitchEdit next = AddService(now, shown, database, service, "");
      edit.content = std::move(next.content);
      edit.warnings.insert(edit.warnings.end(), next.warnings.begin(), next.warnings.end());
    } catch (const Failure& failure) {
      edit.warnings.push_back(AsWarning(database, failure));
      if (!refusal) {
        refusal = failure;
      }
    }
  }
  if (refusal && edit.content == file.Text()) {
    throw *refusal;
  }
  return edit;
}

}  // namespace velmorctl
