#include "system_file/restore.h"

#include <iostream>
#include <vector>

#include "failure.h"
#include "output.h"
#include "system_file/backup_store.h"
#include "text.h"

namespace velmorctl {

namespace {

/// How the command of a backup begins that a restore has left.
std::string RestoreOf(const std::string& kind) {
  return kind + " restore ";
}

/// The backup of a restore is not meant unless it is named: else a second restore would bring the change
/// back.
Backup NewestOf(const BackupStore& store, const std::string& kind) {
  const std::vector<std::string> ids = store.Ids();
  for (const std::string& id : ids) {
    Backup backup = store.Read(id);
    if (!backup.command.starts_with(RestoreOf(kind))) {
      return backup;
    }
  }
  throw Failure(ExitCode::Configuration, "there is no backup to restore")
      .Detail("folder", std::string(backupFolder) + "/" + kind)
      .Try(ids.empty() ? "every change that velmorctl makes leaves a backup; none was made yet"
                       : "give the ID of one that a restore has left: " + Join(ids, ", "));
}

std::vector<std::string> NamesOf(const Backup& backup) {
  std::vector<std::string> names;
  for (const BackedUpFile& file : backup.files) {
    names.push_back(file.name);
  }
  return names;
}

/// A damaged backup must not hide the others.
Backup ReadForListing(const BackupStore& store, const std::string& id) {
  try {
    return store.Read(id);
  } catch (const Failure& failure) {
    return {id, std::string("(") + failure.what() + ")", {}};
  }
}

}  // namespace

ChangeSet PlanRestore(const RootFolder& root, const std::string& kind, const std::string& id) {
  const BackupStore store(root, kind);
  const Backup backup = id.empty() ? NewestOf(store, kind) : store.Read(id);
  ChangeSet changes(root, kind, RestoreOf(kind) + backup.id);
  for (const BackedUpFile& file : backup.files) {
    Snapshot now = ReadSystemFileIfThere(root, file.name);
    if (file.existed) {
      changes.Write(std::move(now), file.content, {file.mode, file.owner, file.group});
    } else {
      changes.Remove(std::move(now));
    }
  }
  return changes;
}

void PrintBackups(const RootFolder& root, const std::string& kind, bool json) {
  const BackupStore store(root, kind);
  Json entries = Json::array();
  std::vector<std::vector<std::string>> rows = {{"BACKUP", "BEFORE", "FILES"}};
  for (const std::string& id : store.Ids()) {
    const Backup backup = ReadForListing(store, id);
    entries.push_back({{"id", id}, {"command", backup.command}, {"files", NamesOf(backup)}});
    rows.push_back({id, backup.command, Join(NamesOf(backup), " ")});
  }
  if (json) {
    PrintJson({{"schema", "velmor.backups/1"}, {"kind", kind}, {"backups", entries}});
  } else if (entries.empty()) {
    std::cout << "There are no backups.\n";
  } else {
    PrintTable(rows);
  }
}

}  // namespace velmorctl
