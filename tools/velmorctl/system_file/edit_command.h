/// What every command that changes system files does alike.
#ifndef VELMORCTL_SYSTEM_FILE_EDIT_COMMAND_H
#define VELMORCTL_SYSTEM_FILE_EDIT_COMMAND_H

#include <string>

#include "command_line.h"
#include "exit_codes.h"
#include "situation.h"
#include "system_file/change_set.h"

namespace velmorctl {

/// Adds the flag --dry-run.
void AddDryRunFlag(CLI::App& command, bool& dryRun);

/// Adds the argument that names a backup to restore, as PlanRestore() takes it.
void AddBackupArgument(CLI::App& command, std::string& backup);

/// Prints the planned changes as a unified diff and, unless `dryRun`, makes them and tells how to undo them.
/// Says so when there is nothing to change. Throws Failure: NeedsRoot when the running system is to be
/// changed by another user, Other when the changes could not be printed, and what ChangeSet::Apply() throws.
ExitCode ShowAndApply(const ChangeSet& changes, const RootFolder& root, bool dryRun, Situation& situation);

/// Prints the planned changes as a unified diff and changes nothing: Difference, or Fine when there are none.
ExitCode ShowDifference(const ChangeSet& changes);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_EDIT_COMMAND_H
