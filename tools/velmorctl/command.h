/// The commands of velmorctl. A new one is a file command_NAME.cc, a declaration here and a row in the table.
#ifndef VELMORCTL_COMMAND_H
#define VELMORCTL_COMMAND_H

#include <functional>
#include <memory>
#include <span>

#include "command_line.h"
#include "exit_codes.h"
#include "situation.h"

namespace velmorctl {

/// What the command line has selected.
struct Invocation {
  std::function<ExitCode(Situation&)> run;
};

/// Adds the command with its subcommands and options to the command line. When one of them is selected, it
/// sets Invocation::run, which is called once the whole command line has been read.
using AddCommand = void (*)(CLI::App& root, Invocation& invocation);

/// The table of commands, in the order of the help text.
std::span<const AddCommand> Commands();

void AddStoreCommand(CLI::App& root, Invocation& invocation);
void AddProviderCommand(CLI::App& root, Invocation& invocation);
void AddJoinCommand(CLI::App& root, Invocation& invocation);
void AddLeaveCommand(CLI::App& root, Invocation& invocation);
void AddStatusCommand(CLI::App& root, Invocation& invocation);
void AddTrustCommand(CLI::App& root, Invocation& invocation);
void AddDomainControllerCommand(CLI::App& root, Invocation& invocation);
void AddSmartCardCommand(CLI::App& root, Invocation& invocation);
void AddOptionCommand(CLI::App& root, Invocation& invocation);
void AddCamCommand(CLI::App& root, Invocation& invocation);
void AddNameServiceCommand(CLI::App& root, Invocation& invocation);
void AddPamCommand(CLI::App& root, Invocation& invocation);

/// Lets the selection of `command` run `run`.
void Bind(CLI::App& command, Invocation& invocation, std::function<ExitCode(Situation&)> run);

/// Lets the selection of `command` run `run` with the options that were read for it.
template <class Options>
void Bind(CLI::App& command, Invocation& invocation, const std::shared_ptr<Options>& options,
          ExitCode (*run)(const Options&, Situation&)) {
  Bind(command, invocation, [options, run](Situation& situation) { return run(*options, situation); });
}

/// Throws Failure unless the command runs as root; `doing` is what it is for.
void RequireRoot(const std::string& doing);

}  // namespace velmorctl

#endif  // VELMORCTL_COMMAND_H
