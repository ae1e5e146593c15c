/// velmorctl dc: the domain controllers that the host uses.
#include <CLI/App.hpp>
#include <algorithm>
#include <iostream>

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
  int timeoutSeconds = defaultTimeoutSeconds;
  std::string domain;
  std::vector<std::string> controllers;
  bool none = false;
};

ExitCode Show(const Options& options, Situation& situation) {
  situation.doing = "ask for the domain controller";
  Directory directory{std::chrono::seconds(options.timeoutSeconds)};
  std::string domain = options.domain.empty() ? directory.JoinedDomain() : options.domain;
  auto configuration = directory.Configuration();
  std::optional<std::string> controller = directory.ControllerOf(domain);
  const auto& preferred = configuration.value.preferredDomainControllers;
  if (options.json) {
    PrintJson({{"schema", "velmor.dc/1"},
               {"domain", domain},
               {"domainController", controller ? Json(*controller) : Json()},
               {"preferredDomainControllers", preferred},
               {"live", configuration.live && controller}});
  } else {
    std::vector<std::string> names(preferred.begin(), preferred.end());
    PrintTable({{"Domain:", domain},
                {"Domain controller:", !controller           ? "no answer"
                                       : controller->empty() ? "not named by the provider"
                                                             : *controller},
                {"Preferred controllers:", names.empty() ? "none" : Join(names, ", ")}});
  }
  return configuration.live && controller ? ExitCode::Fine : ExitCode::FromCache;
}

/// The library only logs that the provider cannot set them, so this looks first.
void RequireSettable() {
  PluginDescription plugin = InspectProvider(InspectProviderFile().value);
  std::vector<std::string> missing = MissingOperations(plugin);
  bool lacking = std::find(missing.begin(), missing.end(), "setPreferredDomainControllers") != missing.end();
  if (lacking) {
    throw Failure(ExitCode::ProviderUnusable,
                  "the provider '" + plugin.name + "' cannot set preferred domain controllers")
        .Detail("file", plugin.file)
        .Try("choose a provider that can with \"velmorctl provider use\"");
  }
}

ExitCode Prefer(const Options& options, Situation& situation) {
  RequireRoot("choose domain controllers");
  situation.doing = "set the preferred domain controllers";
  if (options.none == !options.controllers.empty()) {
    throw Failure(ExitCode::Usage, "either name domain controllers or give --none")
        .Try("velmorctl dc prefer dc1.corp.example dc2.corp.example");
  }
  Directory directory{std::chrono::seconds(defaultTimeoutSeconds)};
  RequireSettable();
  directory.Store()->SetPreferredDomainControllers({options.controllers.begin(), options.controllers.end()});
  std::cout << (options.none ? "No domain controller is preferred.\n"
                             : "Preferred domain controllers: " + Join(options.controllers, ", ") + "\n");
  return ExitCode::Fine;
}

}  // namespace

void AddDomainControllerCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* controller = root.add_subcommand("dc", "Show or choose the domain controllers");
  controller->require_subcommand(1);
  CLI::App* show =
      controller->add_subcommand("show", "Show the domain controller for a domain, and the preferred ones");
  show->add_option("DOMAIN", options->domain, "A domain's DNS name instead of the joined domain's");
  AddJsonFlag(*show, options->json);
  AddTimeoutOption(*show, options->timeoutSeconds);
  Bind(*show, invocation, options, Show);
  CLI::App* prefer = controller->add_subcommand("prefer", "Set the domain controllers to use first");
  prefer->add_option("NAME", options->controllers, "Names of domain controllers, the first one first");
  prefer->add_flag("--none", options->none, "Prefer none");
  Bind(*prefer, invocation, options, Prefer);
}

}  // namespace velmorctl
