#include "system_file/edit_lock.h"

#include <fcntl.h>
#include <sys/file.h>

#include <cerrno>

#include "failure.h"
#include "system_file/backup_store.h"
#include "system_file/file_calls.h"

namespace velmorctl {

EditLock::EditLock(const RootFolder& root)
    : folder_(open(MakeBackupFolder(root).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
  if (!folder_.IsOpen()) {
    ThrowFileFailure("open the folder", root.Shown(backupFolder), errno);
  }
  if (flock(folder_.Get(), LOCK_EX | LOCK_NB) != 0) {
    throw Failure(ExitCode::Conflict, "another velmorctl is changing system files")
        .Try("wait until it has ended, and run the command again");
  }
}

}  // namespace velmorctl
