#include "system_file/file_calls.h"

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>

#include "failure.h"
#include "text.h"

namespace velmorctl {

void ThrowFileFailure(const std::string& doing, const std::string& path, int errorNumber) {
  const bool needsRoot = (errorNumber == EACCES || errorNumber == EPERM) && geteuid() != 0;
  throw Failure(needsRoot ? ExitCode::NeedsRoot : ExitCode::Configuration,
                "cannot " + doing + " '" + path + "': " + SystemErrorText(errorNumber))
      .Detail("file", path)
      .Try(needsRoot ? "run the command as root" : "see that the file system is writable and has free space");
}

velmor::UniqueFd OpenFolder(const std::string& path) {
  open_how how = {};
  how.flags = O_RDONLY | O_DIRECTORY | O_CLOEXEC;
  how.resolve = RESOLVE_NO_SYMLINKS;
  const auto descriptor = static_cast<int>(syscall(SYS_openat2, AT_FDCWD, path.c_str(), &how, sizeof(how)));
  if (descriptor < 0 && errno == ELOOP) {
    throw Failure(ExitCode::Conflict, "'" + path + "' was changed by somebody else meanwhile")
        .Detail("file", path)
        .Detail("reason", "a symbolic link is where none was")
        .Try("run the command again, which then starts from the file as it is now");
  }
  if (descriptor < 0) {
    ThrowFileFailure("open the folder", path, errno);
  }
  return velmor::UniqueFd(descriptor);
}

bool IsFolder(const std::string& path) {
  struct stat status {};
  return stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

void MakeDurableFolder(const std::string& path, mode_t mode) {
  if (mkdir(path.c_str(), mode) != 0) {
    if (errno == EEXIST && IsFolder(path)) {
      return;
    }
    ThrowFileFailure("make the folder", path, errno);
  }
  if (chmod(path.c_str(), mode) != 0) {
    ThrowFileFailure("set the permissions of", path, errno);
  }
  SyncFolder(FolderOf(path));
}

void WriteNewFile(const std::string& path, std::string_view content) {
  const velmor::UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC | O_NOFOLLOW, 0600));
  if (!file.IsOpen()) {
    ThrowFileFailure("make", path, errno);
  }
  while (!content.empty()) {
    const ssize_t written = write(file.Get(), content.data(), content.size());
    if (written < 0 && errno != EINTR) {
      ThrowFileFailure("write", path, errno);
    }
    content.remove_prefix(written < 0 ? 0 : static_cast<std::size_t>(written));
  }
  if (fsync(file.Get()) != 0) {
    ThrowFileFailure("write", path, errno);
  }
}

void SyncFolder(const std::string& path) {
  const velmor::UniqueFd folder(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!folder.IsOpen() || fsync(folder.Get()) != 0) {
    ThrowFileFailure("write the folder", path, errno);
  }
}

std::string FolderOf(const std::string& path) {
  return std::filesystem::path(path).parent_path().string();
}

}  // namespace velmorctl
