/// velmorctl smartcard: the services that may authenticate with a smart card.
#include <CLI/App.hpp>
#include <iostream>

#include "command.h"
#include "directory.h"
#include "failure.h"
#include "output.h"
#include "text.h"

namespace velmorctl {

namespace {

struct Options {
  bool json = false;
  int timeoutSeconds = defaultTimeoutSeconds;
  std::vector<std::string> services;
  bool none = false;
};

ExitCode List(const Options& options, Situation& situation) {
  situation.doing = "ask for the smart-card services";
  Directory directory{std::chrono::seconds(options.timeoutSeconds)};
  std::optional<std::vector<std::string>> services = directory.SmartCardServices();
  if (!services) {
    throw Failure(ExitCode::DomainNotReachable,
                  "the provider did not answer within " + std::to_string(options.timeoutSeconds) + " seconds")
        .Try("velmorctl status");
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.smartcard/1"}, {"services", *services}});
  } else {
    for (const std::string& service : *services) {
      std::cout << Printable(service) << "\n";
    }
  }
  return ExitCode::Fine;
}

ExitCode Set(const Options& options, Situation& situation) {
  RequireRoot("choose the smart-card services");
  situation.doing = "set the smart-card services";
  if (options.none == !options.services.empty()) {
    throw Failure(ExitCode::Usage, "either name services or give --none")
        .Try("velmorctl smartcard set login sshd");
  }
  Directory directory{std::chrono::seconds(defaultTimeoutSeconds)};
  directory.Store()->SetSmartCardEnabledServices(options.services);
  std::cout << (options.none ? "No service may authenticate with a smart card.\n"
                             : "Smart-card services: " + Join(options.services, ", ") + "\n");
  return ExitCode::Fine;
}

}  // namespace

void AddSmartCardCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* smartCard = root.add_subcommand("smartcard", "List or set the services that take smart cards");
  smartCard->require_subcommand(1);
  CLI::App* list =
      smartCard->add_subcommand("list", "List the services that may authenticate with a smart card");
  AddJsonFlag(*list, options->json);
  AddTimeoutOption(*list, options->timeoutSeconds);
  Bind(*list, invocation, options, List);
  CLI::App* set = smartCard->add_subcommand("set", "Set these services");
  set->add_option("SERVICE", options->services, "Names of services; all others lose the right");
  set->add_flag("--none", options->none, "Let no service take smart cards");
  Bind(*set, invocation, options, Set);
}

}  // namespace velmorctl
