/// One command at a time that changes system files.
#ifndef VELMORCTL_SYSTEM_FILE_EDIT_LOCK_H
#define VELMORCTL_SYSTEM_FILE_EDIT_LOCK_H

#include "system_file/root_folder.h"
#include "velmor/unique_fd.h"

namespace velmorctl {

/// Held while system files inside the root are changed; the system takes it away when the process ends. It is
/// a lock on the folder of the backups, which is made when it is missing.
class EditLock {
 public:
  /// Does not wait. Throws Failure: Conflict when another command holds the lock.
  explicit EditLock(const RootFolder& root);

 private:
  velmor::UniqueFd folder_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_EDIT_LOCK_H
