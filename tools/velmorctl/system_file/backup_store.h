/// Dated copies of system files from before each change.
#ifndef VELMORCTL_SYSTEM_FILE_BACKUP_STORE_H
#define VELMORCTL_SYSTEM_FILE_BACKUP_STORE_H

#include <sys/types.h>

#include <string>
#include <vector>

#include "system_file/root_folder.h"
#include "system_file/snapshot.h"

namespace velmorctl {

inline constexpr char backupFolder[] = "/var/lib/quenix/backups";

/// Makes the folder of all backups where it is missing, readable by its owner only, and returns its path on
/// the running system. Throws Failure.
std::string MakeBackupFolder(const RootFolder& root);

/// One file as it was. What is not there any more comes back with its mode and owner.
struct BackedUpFile {
  std::string name;      /// inside the root
  bool existed = false;  /// else a change made it, and restoring removes it
  mode_t mode = 0;       /// permission bits
  uid_t owner = 0;
  gid_t group = 0;
  std::string content;
};

struct Backup {
  std::string id;       /// the time of the backup in UTC, for example 20261121T191500Z; IDs sort by age
  std::string command;  /// the command that made the change, for example "nss add passwd winbind"
  std::vector<BackedUpFile> files;
};

/// The backups of one kind, each a folder that its owner alone may read, under
/// /var/lib/quenix/backups/KIND/ID inside the root. Nothing removes old ones. Use it with the editing lock
/// held when writing.
class BackupStore {
 public:
  /// `kind` is "nss" or "pam".
  BackupStore(RootFolder root, std::string kind);

  /// Writes a backup of the files, durably, and returns its ID. Throws Failure, also
  /// for a file whose name is not UTF-8; nothing is left behind then.
  std::string Write(const std::string& command, const std::vector<Snapshot>& files) const;

  /// The IDs, the newest first. Throws Failure when the folder cannot be read.
  std::vector<std::string> Ids() const;

  /// Reads a backup. Throws Failure when there is none of this ID (Usage), or when it is damaged: its list
  /// cannot be read, or bytes are not those that were written (Configuration).
  Backup Read(const std::string& id) const;

  /// Removes the backup of a change that did not come about.
  void Remove(const std::string& id) const;

 private:
  std::string Folder() const { return std::string(backupFolder) + "/" + kind_; }

  RootFolder root_;
  std::string kind_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_BACKUP_STORE_H
