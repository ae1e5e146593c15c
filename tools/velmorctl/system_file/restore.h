/// Going back to a backup.
#ifndef VELMORCTL_SYSTEM_FILE_RESTORE_H
#define VELMORCTL_SYSTEM_FILE_RESTORE_H

#include <string>

#include "system_file/change_set.h"
#include "system_file/root_folder.h"

namespace velmorctl {

/// Plans that the files of the backup are as they were: content put back, a file made again with its mode and
/// owner, a file that the change had made removed. An empty `id` is the newest backup of the kind that no
/// restore has left. Like every change it is backed up itself, so it can be undone by that backup's ID.
/// Throws Failure: what BackupStore::Read throws, and Configuration when there is no backup.
ChangeSet PlanRestore(const RootFolder& root, const std::string& kind, const std::string& id);

/// Prints the backups of the kind, the newest first: a table, or a JSON document.
void PrintBackups(const RootFolder& root, const std::string& kind, bool json);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_RESTORE_H
