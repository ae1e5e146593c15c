/// Changes of several system files that happen together or not at all.
#ifndef VELMORCTL_SYSTEM_FILE_CHANGE_SET_H
#define VELMORCTL_SYSTEM_FILE_CHANGE_SET_H

#include <optional>
#include <string>
#include <vector>

#include "hostmgmt/replace_file.h"
#include "situation.h"
#include "system_file/backup_store.h"
#include "system_file/root_folder.h"
#include "system_file/snapshot.h"

namespace velmorctl {

using HostMgmt::NewFileAttributes;

/// Plans first and writes then; for one thread.
class ChangeSet {
 public:
  /// `kind` and `command` are those of the backup that Apply() writes.
  ChangeSet(RootFolder root, std::string kind, std::string command);

  /// Plans that the file of the snapshot has this content. It is made, with these attributes, when the
  /// snapshot says that there is none; else mode, owner and extended attributes stay. Content that is there
  /// already is no change.
  void Write(Snapshot before, std::string content, const NewFileAttributes& whenNew = {});

  /// Plans that the file of the snapshot does not exist. No change when it does not.
  void Remove(Snapshot before);

  const std::string& Kind() const { return kind_; }
  bool ChangesNothing() const { return edits_.empty(); }

  /// The planned changes as a unified diff, in the order in which they were planned.
  std::string Diff() const;

  /// Has the report of a failure tell which of the files were changed.
  void Watch(Situation& situation) const;

  /// Writes a backup of all files, then makes the changes: each file is replaced at once for its readers and
  /// durably, and read again to prove that it is what was planned. Returns the ID of the backup. Signals
  /// that would end the command wait meanwhile; a wait for the disk is the longest that it takes.
  ///
  /// Right before a file is replaced its name is resolved and the file read once more, and no link that
  /// appears after that is followed. A change that a program makes in the moments until the new file takes
  /// its place, without the editing lock, is lost. Backups are written by name, so /var of a root is to be
  /// one that only trusted users may write.
  ///
  /// Throws Failure, after it has put back what it had changed and removed the backup: Conflict when another
  /// command is at it, or a file is not as it was read; Configuration when a file cannot be written, or is
  /// not what was written. When a file could not be put back, or somebody else has changed it meanwhile, the
  /// failure names it, and the backup stays.
  std::string Apply() const;

 private:
  struct Edit {
    Snapshot before;
    std::optional<std::string> after;  // nothing when the file goes
    NewFileAttributes whenNew;
  };

  void RequireUnchanged(const Edit& edit) const;
  void Perform(const Edit& edit) const;
  void Prove(const Edit& edit) const;
  bool PutBack(const Edit& edit) const;
  [[noreturn]] void UndoAndThrow(std::size_t performed, const BackupStore& store, const std::string& backup,
                                 const std::exception& cause) const;

  RootFolder root_;
  std::string kind_;
  std::string command_;
  std::vector<Edit> edits_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_CHANGE_SET_H
