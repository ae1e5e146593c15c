/// velmorctl pam: the policies by which programs let users in.
#include <CLI/App.hpp>

#include "command.h"
#include "pam/subcommands.h"

namespace velmorctl {

namespace {

constexpr AddCommand subcommands[] = {pam::AddShow, pam::AddCheck, pam::AddSimulate, pam::AddEdits};

}  // namespace

void AddPamCommand(CLI::App& root, Invocation& invocation) {
  CLI::App* pam =
      root.add_subcommand("pam", "Show, check and change the PAM policies of the host's services");
  pam->require_subcommand(1);
  for (AddCommand add : subcommands) {
    add(*pam, invocation);
  }
}

}  // namespace velmorctl
