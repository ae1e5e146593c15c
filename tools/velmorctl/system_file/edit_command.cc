#include "system_file/edit_command.h"

#include <iostream>

#include "command.h"
#include "system_file/unified_diff.h"

namespace velmorctl {

void AddDryRunFlag(CLI::App& command, bool& dryRun) {
  command.add_flag("--dry-run", dryRun, "Show the change and write nothing, not even a backup");
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
  changes.Watch(situation);
  const std::string backup = changes.Apply();
  std::cout << "Done. To undo it: velmorctl " << changes.Kind() << " restore " << backup
            << (root.IsHost() ? "" : " --root " + root.Shown("")) << "\n";
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
