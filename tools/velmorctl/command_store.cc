/// velmorctl store: which store authenticates the host's users.
#include <CLI/App.hpp>
#include <iostream>

#include "authentication/authentication_store_factory.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "output.h"
#include "settings_file.h"
#include "text.h"

namespace velmorctl {

namespace {

using quenix::authentication::AuthenticationStore;
using quenix::authentication::AuthenticationStoreFactory;
using quenix::authentication::Singleton;

struct Options {
  bool json = false;
  std::string name;
};

AuthenticationStoreFactory& Factory() {
  return *Singleton<AuthenticationStoreFactory>::_instance;
}

std::string ActiveStore(const std::string& doing) {
  SettingsInspection inspection = InspectAuthenticationFile();
  if (inspection.problem) {
    throw AsFailure(*inspection.problem, ExitCode::Configuration, "cannot " + doing);
  }
  return inspection.value;
}

ExitCode List(const Options& options, Situation&) {
  std::string active = ActiveStore("tell which store is active");
  Json stores = Json::array();
  std::vector<std::vector<std::string>> rows = {{"STORE", "ACTIVE"}};
  for (const std::string& name : Factory().GetRegisteredStores()) {
    stores.push_back({{"name", name}, {"active", name == active}});
    rows.push_back({name, name == active ? "yes" : "no"});
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.store-list/1"}, {"stores", stores}});
  } else {
    PrintTable(rows);
  }
  return ExitCode::Fine;
}

ExitCode Show(const Options& options, Situation&) {
  std::string active = ActiveStore("tell which store is active");
  if (options.json) {
    PrintJson({{"schema", "velmor.store/1"}, {"name", active}, {"file", authenticationFile}});
  } else {
    std::cout << active << "\n";
  }
  return ExitCode::Fine;
}

/// The store "None" is recorded before the store of before is let go, and stays recorded when that fails;
/// that is what was asked for, so it is no failure of the command.
void MakeActive(AuthenticationStore& store) {
  try {
    store.MakeActive();
  } catch (const std::exception& exception) {
    if (InspectAuthenticationFile().value != store.GetDisplayName()) {
      throw;
    }
    std::cerr << "velmorctl: warning: the store of before could not be let go: "
              << Printable(exception.what()) << "\n";
  }
}

ExitCode Use(const Options& options, Situation& situation) {
  RequireRoot("change the active store");
  situation.doing = "make the store \"" + options.name + "\" active";
  situation.Watch(authenticationFile);
  if (options.name == "Active Directory") {
    RequireUsableProvider();
  }
  std::unique_ptr<AuthenticationStore> store = Factory().CreateInstance(options.name);
  if (!store) {
    throw Failure(ExitCode::Usage, "there is no store \"" + options.name + "\"")
        .Try("\"" + Join(Factory().GetRegisteredStores(), "\" or \"") + "\", written so");
  }
  MakeActive(*store);
  std::cout << "The active store is \"" << store->GetDisplayName() << "\".\n";
  return ExitCode::Fine;
}

}  // namespace

void AddStoreCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* store = root.add_subcommand("store", "Show or choose the store that authenticates the users");
  store->require_subcommand(1);
  CLI::App* list = store->add_subcommand("list", "List the stores");
  AddJsonFlag(*list, options->json);
  Bind(*list, invocation, options, List);
  CLI::App* show = store->add_subcommand("show", "Show the active store");
  AddJsonFlag(*show, options->json);
  Bind(*show, invocation, options, Show);
  CLI::App* use = store->add_subcommand("use", "Make a store the active one");
  use->add_option("NAME", options->name, "The store's name, for example None or \"Active Directory\"")
      ->required();
  Bind(*use, invocation, options, Use);
}

}  // namespace velmorctl
