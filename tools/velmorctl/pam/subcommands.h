/// The subcommands of "velmorctl pam".
#ifndef VELMORCTL_PAM_SUBCOMMANDS_H
#define VELMORCTL_PAM_SUBCOMMANDS_H

#include "command.h"
#include "command_line.h"

namespace velmorctl::pam {

void AddShow(CLI::App& pam, Invocation& invocation);
void AddCheck(CLI::App& pam, Invocation& invocation);
void AddSimulate(CLI::App& pam, Invocation& invocation);

/// diff, enable, disable, backups and restore.
void AddEdits(CLI::App& pam, Invocation& invocation);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_SUBCOMMANDS_H
