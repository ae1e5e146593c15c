/// velmorctl nss: the name-service switch.
#include <CLI/App.hpp>
#include <iostream>

#include "command.h"
#include "failure.h"
#include "nss/provider_service.h"
#include "nss/service_modules.h"
#include "nss/switch_check.h"
#include "nss/switch_edit.h"
#include "nss/switch_file.h"
#include "output.h"
#include "system_file/change_set.h"
#include "system_file/edit_command.h"
#include "system_file/findings.h"
#include "system_file/restore.h"
#include "system_file/root_folder.h"
#include "system_file/snapshot.h"
#include "text.h"

namespace velmorctl {

namespace {

constexpr char kind[] = "nss";

struct Options {
  bool json = false;
  bool dryRun = false;
  bool list = false;
  std::string root = "/";
  std::string database;
  std::string service;
  std::string after;
  std::string backup;
};

std::string ServicesText(const SwitchLine& line) {
  std::vector<std::string> words;
  for (const SwitchService& service : line.services) {
    words.push_back(service.meaning.name);
    if (!service.meaning.criterion.empty()) {
      words.push_back("[" + Join(service.meaning.criterion, " ") + "]");
    }
  }
  return Join(words, " ");
}

Json AsJson(const SwitchFile& file, const SwitchLine& line) {
  Json services = Json::array();
  for (const SwitchService& service : line.services) {
    services.push_back({{"name", service.meaning.name}, {"criterion", service.meaning.criterion}});
  }
  return {
      {"name", line.database}, {"line", line.number}, {"counts", file.Counts(line)}, {"services", services}};
}

std::vector<const SwitchLine*> LinesToShow(const SwitchFile& file, const std::string& database) {
  if (!database.empty()) {
    return file.LinesOf(database);
  }
  std::vector<const SwitchLine*> lines;
  for (const SwitchLine& line : file.Lines()) {
    if (!line.database.empty()) {
      lines.push_back(&line);
    }
  }
  return lines;
}

ExitCode Show(const Options& options, Situation&) {
  const Snapshot snapshot = ReadSystemFile(RootFolder(options.root), switchFileName);
  const SwitchFile file(snapshot.content);
  const std::vector<const SwitchLine*> lines = LinesToShow(file, options.database);
  if (lines.empty() && !options.database.empty()) {
    throw Failure(ExitCode::Configuration, "there is no database '" + options.database + "'")
        .Detail("file", snapshot.shown)
        .Try("\"velmorctl nss show\" shows the databases that have a line");
  }
  Json databases = Json::array();
  std::vector<std::vector<std::string>> rows = {{"DATABASE", "SERVICES"}};
  for (const SwitchLine* line : lines) {
    databases.push_back(AsJson(file, *line));
    rows.push_back({line->database, ServicesText(*line) + (file.Counts(*line) ? "" : " (does not count)")});
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.nss/1"}, {"file", snapshot.shown}, {"databases", databases}});
  } else {
    PrintTable(rows);
  }
  return ExitCode::Fine;
}

ExitCode Check(const Options& options, Situation&) {
  const RootFolder root(options.root);
  const Snapshot snapshot = ReadSystemFile(root, switchFileName);
  const std::vector<FileProblem> findings =
      CheckSwitchFile(SwitchFile(snapshot.content), snapshot.shown, ServiceModules(root));
  return PrintFindings(findings, "velmor.nss-check/1", options.json);
}

void Warn(const std::string& warning) {
  std::cerr << "velmorctl: warning: " << Printable(warning) << "\n";
}

/// The edit of the file as it was read.
ChangeSet Changes(const RootFolder& root, const Snapshot& snapshot, const SwitchEdit& edit,
                  const std::string& command) {
  for (const std::string& warning : edit.warnings) {
    Warn(warning);
  }
  ChangeSet changes(root, kind, command);
  changes.Write(snapshot, edit.content);
  return changes;
}

void WarnOfMissingModule(const RootFolder& root, const std::string& service) {
  const ServiceModules modules(root);
  if (modules.CanTell() && !modules.Has(service)) {
    Warn("there is no module libnss_" + service + ".so.2 yet, so the service finds nothing");
  }
}

ExitCode Diff(const Options& options, Situation&) {
  const RootFolder root(options.root);
  const Snapshot snapshot = ReadSystemFile(root, switchFileName);
  const ServiceMeaning service = ProviderService(root);
  const SwitchEdit edit = AddToAccountDatabases(SwitchFile(snapshot.content), snapshot.shown, service);
  return ShowDifference(Changes(root, snapshot, edit, "nss diff"));
}

ExitCode Add(const Options& options, Situation& situation) {
  situation.doing = "add the service '" + options.service + "'";
  const RootFolder root(options.root);
  const Snapshot snapshot = ReadSystemFile(root, switchFileName);
  const SwitchEdit edit = AddService(SwitchFile(snapshot.content), snapshot.shown, options.database,
                                     ServiceCalled(options.service, root), options.after);
  if (edit.content != snapshot.content) {
    WarnOfMissingModule(root, options.service);
  }
  const ChangeSet changes =
      Changes(root, snapshot, edit, "nss add " + options.database + " " + options.service);
  return ShowAndApply(changes, root, options.dryRun, situation);
}

ExitCode Remove(const Options& options, Situation& situation) {
  situation.doing = "remove the service '" + options.service + "'";
  const RootFolder root(options.root);
  const Snapshot snapshot = ReadSystemFile(root, switchFileName);
  const SwitchEdit edit =
      RemoveService(SwitchFile(snapshot.content), snapshot.shown, options.database, options.service);
  const ChangeSet changes =
      Changes(root, snapshot, edit, "nss remove " + options.database + " " + options.service);
  return ShowAndApply(changes, root, options.dryRun, situation);
}

ExitCode Restore(const Options& options, Situation& situation) {
  situation.doing = "restore a backup";
  const RootFolder root(options.root);
  if (options.list) {
    PrintBackups(root, kind, options.json);
    return ExitCode::Fine;
  }
  return ShowAndApply(PlanRestore(root, kind, options.backup), root, options.dryRun, situation);
}

void AddReadingCommands(CLI::App& nss, Invocation& invocation, const std::shared_ptr<Options>& options) {
  CLI::App* show = nss.add_subcommand("show", "Show the services of each database, or of one");
  show->add_option("DATABASE", options->database, "For example passwd");
  AddJsonFlag(*show, options->json);
  AddRootOption(*show, options->root);
  Bind(*show, invocation, options, Show);
  CLI::App* check = nss.add_subcommand("check", "Look for faults");
  AddJsonFlag(*check, options->json);
  AddRootOption(*check, options->root);
  Bind(*check, invocation, options, Check);
  CLI::App* diff = nss.add_subcommand("diff", "Show what the provider's accounts need changed");
  AddRootOption(*diff, options->root);
  Bind(*diff, invocation, options, Diff);
}

void AddEditingCommands(CLI::App& nss, Invocation& invocation, const std::shared_ptr<Options>& options) {
  CLI::App* add = nss.add_subcommand("add", "Add a service to a database");
  add->add_option("DATABASE", options->database, "For example passwd")->required();
  add->add_option("SERVICE", options->service, "For example winbind")->required();
  add->add_option("--after", options->after, "The service to put it behind, instead of at the end")
      ->type_name("SERVICE");
  CLI::App* remove = nss.add_subcommand("remove", "Take a service out of a database");
  remove->add_option("DATABASE", options->database, "For example passwd")->required();
  remove->add_option("SERVICE", options->service, "For example winbind")->required();
  CLI::App* restore = nss.add_subcommand("restore", "Go back to a backup");
  AddBackupArgument(*restore, options->backup);
  CLI::Option* list = restore->add_flag("--list", options->list, "List the backups and restore nothing");
  restore->add_flag("--json", options->json, "Print the list as a JSON document")->needs(list);
  for (CLI::App* command : {add, remove, restore}) {
    AddDryRunFlag(*command, options->dryRun);
    AddRootOption(*command, options->root);
  }
  Bind(*add, invocation, options, Add);
  Bind(*remove, invocation, options, Remove);
  Bind(*restore, invocation, options, Restore);
}

}  // namespace

void AddNameServiceCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* nss = root.add_subcommand("nss", "Show or change which services names are looked up with");
  nss->require_subcommand(1);
  AddReadingCommands(*nss, invocation, options);
  AddEditingCommands(*nss, invocation, options);
}

}  // namespace velmorctl
