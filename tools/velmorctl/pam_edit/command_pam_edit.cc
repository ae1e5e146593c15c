/// velmorctl pam diff, enable, disable, backups and restore: changes of the policies.
#include <CLI/App.hpp>
#include <iostream>

#include "output.h"
#include "pam/subcommands.h"
#include "pam_edit/edit_plan.h"
#include "system_file/change_set.h"
#include "system_file/edit_command.h"
#include "system_file/restore.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

constexpr char kind[] = "pam";

struct Options {
  bool json = false;
  bool enable = false;
  bool disable = false;
  bool dryRun = false;
  std::string backup;
  std::string root = "/";
};

/// The provider's module, unless there is no provider that can be used.
std::optional<DirectoryModule> FindDirectoryModule(const RootFolder& root) {
  try {
    return ReadDirectoryModule(root);
  } catch (const Failure&) {
    return std::nullopt;  // What velmorctl has put in can be told without it.
  }
}

EditPlan PlanFor(bool enable, const RootFolder& root) {
  return enable ? PlanEnable(root, ReadDirectoryModule(root)) : PlanDisable(root, FindDirectoryModule(root));
}

void PrintRemarks(const EditPlan& plan) {
  for (const std::string& note : plan.notes) {
    std::cerr << "velmorctl: note: " << Printable(note) << "\n";
  }
  for (const Refusal& refusal : plan.refusals) {
    std::cerr << "velmorctl: warning: the service '" << Printable(refusal.service)
              << "' stays as it is: " << Printable(refusal.reason) << "\n";
  }
}

ChangeSet ChangesOf(const EditPlan& plan, const RootFolder& root, const std::string& command) {
  ChangeSet changes(root, kind, command);
  plan.files.AddTo(changes);
  return changes;
}

/// A service that was left out is a result of its own, whatever was done to the others.
ExitCode WithRefusals(ExitCode code, const EditPlan& plan) {
  return plan.refusals.empty() ? code : ExitCode::HostNotReady;
}

ExitCode Diff(const Options& options, Situation& situation) {
  situation.doing = "plan the change";
  const RootFolder root(options.root);
  EditPlan plan = PlanFor(options.enable, root);
  PrintRemarks(plan);
  ExitCode code = ShowDifference(ChangesOf(plan, root, "pam diff"));
  return code == ExitCode::Difference ? code : WithRefusals(code, plan);
}

ExitCode Change(bool enable, const Options& options, Situation& situation) {
  situation.doing = std::string(enable ? "enable" : "disable") + " logins through the directory";
  const RootFolder root(options.root);
  EditPlan plan = PlanFor(enable, root);
  PrintRemarks(plan);
  ChangeSet changes = ChangesOf(plan, root, enable ? "pam enable" : "pam disable");
  return WithRefusals(ShowAndApply(changes, root, options.dryRun, situation), plan);
}

ExitCode Enable(const Options& options, Situation& situation) {
  return Change(true, options, situation);
}

ExitCode Disable(const Options& options, Situation& situation) {
  return Change(false, options, situation);
}

ExitCode Backups(const Options& options, Situation&) {
  PrintBackups(RootFolder(options.root), kind, options.json);
  return ExitCode::Fine;
}

ExitCode Restore(const Options& options, Situation& situation) {
  situation.doing = "restore a backup";
  const RootFolder root(options.root);
  return ShowAndApply(PlanRestore(root, kind, options.backup), root, options.dryRun, situation);
}

}  // namespace

void AddEdits(CLI::App& pam, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* diff = pam.add_subcommand("diff", "Show what \"enable\" or \"disable\" would change");
  CLI::Option_group* which = diff->add_option_group("which");
  which->add_flag("--enable", options->enable, "What \"enable\" would change");
  which->add_flag("--disable", options->disable, "What \"disable\" would change");
  which->require_option(1);
  CLI::App* enable =
      pam.add_subcommand("enable", "Let users of the directory log in through this host's services");
  CLI::App* disable = pam.add_subcommand("disable", "Take out what \"enable\" has put in");
  CLI::App* backups = pam.add_subcommand("backups", "List the backups");
  AddJsonFlag(*backups, options->json);
  CLI::App* restore = pam.add_subcommand("restore", "Go back to a backup");
  AddBackupArgument(*restore, options->backup);
  for (CLI::App* command : {enable, disable, restore}) {
    AddDryRunFlag(*command, options->dryRun);
  }
  for (CLI::App* command : {diff, enable, disable, backups, restore}) {
    AddRootOption(*command, options->root);
  }
  Bind(*diff, invocation, options, Diff);
  Bind(*enable, invocation, options, Enable);
  Bind(*disable, invocation, options, Disable);
  Bind(*backups, invocation, options, Backups);
  Bind(*restore, invocation, options, Restore);
}

}  // namespace velmorctl::pam
