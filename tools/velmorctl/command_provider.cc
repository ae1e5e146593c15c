/// velmorctl provider: which plug-in talks to the directory.
#include <CLI/App.hpp>
#include <iostream>

#include "authentication/configuration.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "output.h"
#include "plugin_file.h"
#include "settings_file.h"
#include "text.h"

namespace velmorctl {

namespace {

struct Options {
  bool json = false;
  std::string name;
};

Json AsJson(const PluginDescription& plugin) {
  Json operations = Json::object();
  for (const auto& [name, present] : plugin.operations) {
    operations[name] = present;
  }
  return {{"name", plugin.name},
          {"file", plugin.file},
          {"usable", !plugin.problem},
          {"problem", plugin.problem ? Json(plugin.problem->reason) : Json()},
          {"apiVersion", plugin.apiVersion},
          {"pamModule", plugin.pamModule},
          {"pamModuleParameters", plugin.pamModuleParameters},
          {"nssModule", plugin.nssModule},
          {"nssModuleParameters", plugin.nssModuleParameters},
          {"operations", operations}};
}

ExitCode List(const Options& options, Situation&) {
  std::string configured = InspectProviderFile().value;
  Json providers = Json::array();
  std::vector<std::vector<std::string>> rows = {{"PROVIDER", "IN USE", "VERSION", "STATE"}};
  for (const PluginDescription& plugin : InspectAllProviders()) {
    bool inUse = plugin.name == configured;
    Json entry = AsJson(plugin);
    entry["inUse"] = inUse;
    providers.push_back(entry);
    rows.push_back({plugin.name, inUse ? "yes" : "no",
                    plugin.kind == PluginKind::Unknown ? "-" : std::to_string(plugin.apiVersion),
                    plugin.problem ? plugin.problem->reason : "usable"});
  }
  if (options.json) {
    PrintJson(
        {{"schema", "velmor.provider-list/1"}, {"directory", pluginDirectory}, {"providers", providers}});
  } else {
    PrintTable(rows);
  }
  return ExitCode::Fine;
}

std::string OperationsText(const PluginDescription& plugin) {
  std::vector<std::string> missing = MissingOperations(plugin);
  return missing.empty() ? "all" : "all but " + Join(missing, ", ");
}

ExitCode Show(const Options& options, Situation&) {
  SettingsInspection settings = InspectProviderFile();
  if (settings.problem) {
    bool noProvider = settings.problem->kind == FileProblem::Kind::Missing ||
                      settings.problem->kind == FileProblem::Kind::NoValue;
    throw AsFailure(*settings.problem, noProvider ? ExitCode::ProviderUnusable : ExitCode::Configuration,
                    "cannot tell which provider is in use");
  }
  PluginDescription plugin = InspectProvider(settings.value);
  if (plugin.problem) {
    throw AsFailure(*plugin.problem, ExitCode::ProviderUnusable,
                    "the provider '" + plugin.name + "' cannot be used");
  }
  if (options.json) {
    Json document = {{"schema", "velmor.provider/1"}};
    document.update(AsJson(plugin));
    PrintJson(document);
    return ExitCode::Fine;
  }
  PrintTable({{"Provider:", plugin.name},
              {"File:", plugin.file},
              {"Interface version:", std::to_string(plugin.apiVersion)},
              {"PAM module:", plugin.pamModule + " " + plugin.pamModuleParameters},
              {"Name-service module:", plugin.nssModule + " " + plugin.nssModuleParameters},
              {"Operations:", OperationsText(plugin)}});
  return ExitCode::Fine;
}

/// The entries of provider.conf, or none when there is no such file.
std::map<std::string, std::string> CurrentEntries(const SettingsInspection& settings) {
  if (settings.problem && settings.problem->kind == FileProblem::Kind::Missing) {
    return {};
  }
  if (settings.problem && settings.problem->kind == FileProblem::Kind::Unreadable) {
    throw AsFailure(*settings.problem, ExitCode::Configuration, "cannot change the provider");
  }
  return quenix::authentication::ProviderConfiguration();
}

ExitCode Use(const Options& options, Situation& situation) {
  RequireRoot("change the provider");
  situation.doing = "make '" + options.name + "' the provider";
  situation.Watch(providerFile);
  if (!IsProviderName(options.name)) {
    throw Failure(ExitCode::Usage, "'" + options.name + "' cannot be a provider's name")
        .Try("give the name that \"velmorctl provider list\" shows, without \"lib\" and \".so\"");
  }
  PluginDescription plugin = InspectProvider(options.name);
  if (plugin.problem) {
    throw AsFailure(*plugin.problem, ExitCode::ProviderUnusable,
                    "the provider '" + options.name + "' cannot be used");
  }
  SettingsInspection settings = InspectProviderFile();
  std::map<std::string, std::string> entries = CurrentEntries(settings);
  entries[providerKey] = options.name;
  ReplaceSettingsFile(providerFile, entries);
  std::cout << "The provider is '" << options.name << "'.\n";
  if (settings.value != options.name && ReadJoinRecord()) {
    std::cerr << "velmorctl: warning: the host was joined with the provider '" << Printable(settings.value)
              << "', and only that one can leave the domain\n";
  }
  return ExitCode::Fine;
}

}  // namespace

void AddProviderCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* provider =
      root.add_subcommand("provider", "Show or choose the plug-in that talks to the directory");
  provider->require_subcommand(1);
  CLI::App* list = provider->add_subcommand("list", "List the providers that are installed");
  AddJsonFlag(*list, options->json);
  Bind(*list, invocation, options, List);
  CLI::App* show = provider->add_subcommand("show", "Show the provider in use");
  AddJsonFlag(*show, options->json);
  Bind(*show, invocation, options, Show);
  CLI::App* use = provider->add_subcommand("use", "Choose the provider");
  use->add_option("NAME", options->name, "The provider's name, for example samba")->required();
  Bind(*use, invocation, options, Use);
}

}  // namespace velmorctl
