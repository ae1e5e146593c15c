#include "command.h"

#include <unistd.h>

#include <CLI/App.hpp>
#include <utility>

#include "failure.h"

namespace velmorctl {

namespace {

constexpr AddCommand commands[] = {AddStatusCommand,
                                   AddJoinCommand,
                                   AddLeaveCommand,
                                   AddTrustCommand,
                                   AddStoreCommand,
                                   AddProviderCommand,
                                   AddDomainControllerCommand,
                                   AddSmartCardCommand,
                                   AddOptionCommand,
                                   AddCamCommand,
                                   AddNameServiceCommand,
                                   AddPamCommand};

}  // namespace

std::span<const AddCommand> Commands() {
  return commands;
}

void Bind(CLI::App& command, Invocation& invocation, std::function<ExitCode(Situation&)> run) {
  command.callback([&invocation, run = std::move(run)] { invocation.run = run; });
}

void RequireRoot(const std::string& doing) {
  if (geteuid() != 0) {
    throw Failure(ExitCode::NeedsRoot, "only root may " + doing).Try("run the command as root");
  }
}

}  // namespace velmorctl
