#include "system_file/edit_command.h"

#include <CLI/App.hpp>
#include <iostream>

#include "command.h"
#include "failure.h"
#include "system_file/unified_diff.h"
#include "text.h"

namespace velmorctl {

void AddDryRunFlag(CLI::App& command, bool& dryRun) {
  command.add_flag("--dry-run", dryRun, "Show the change and write nothing, not even a backup");
}

void AddBackupArgument(CLI::App& command, std::string& backup) {
  command.add_option("ID", backup, "The backup; without it the newest that no restore has left");
}

ExitCode ShowAndApply(const ChangeSet& changes, const RootFolder& root, bool dryRun, Situation& situation) {
  if (changes.ChangesNothing()) {
    std::cout << "There is nothing to change.\n";
    return ExitCode::Fine;
  }
  if (root.IsHost() && !dryRun) {
    RequireRoot("change system files");
  }
  std::cout << PrintableLines(changes.Diff());
  if (dryRun) {
    std::cout << "Nothing was written.\n";
    return ExitCode::Fine;
  }
  // What the administrator could not see is not done.
  if (!std::cout.flush()) {
    throw Failure(ExitCode::Other, "cannot write the output").Try("check where standard output goes");
  }
  changes.Watch(situation);
  const std::string backup = changes.Apply();
  std::cout << "Done. To undo it: velmorctl " << changes.Kind() << " restore " << backup
            << Printable(root.Option()) << "\n";
  return ExitCode::Fine;
}

ExitCode ShowDifference(const ChangeSet& changes) {
  if (changes.ChangesNothing()) {
    std::cout << "There is nothing to change.\n";
    return ExitCode::Fine;
  }
  std::cout << PrintableLines(changes.Diff());
  return ExitCode::Difference;
}

}  // namespace velmorctl
