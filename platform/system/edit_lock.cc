#include "system/edit_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>

#include <cerrno>
#include <chrono>
#include <thread>

#include "system/system_error.h"

namespace HostMgmt::System {
namespace {

constexpr char kLockDirectory[] = "/run/quenix";
constexpr std::chrono::seconds kLongestWait(10);
constexpr std::chrono::milliseconds kPollInterval(5);

[[noreturn]] void ThrowLockError(const std::string& editedPath, const std::string& lockPath,
                                 const std::string& reason) {
  ThrowFileError("change", editedPath, "cannot lock '" + lockPath + "': " + reason);
}

std::string LockPath(const std::string& name) {
  return std::string(kLockDirectory) + "/" + name + ".lock";
}

velmor::UniqueFd OpenLockFile(const std::string& lockPath, const std::string& editedPath) {
  if (mkdir(kLockDirectory, 0755) != 0 && errno != EEXIST) {
    ThrowLockError(editedPath, lockPath, ErrorText(errno));
  }
  velmor::UniqueFd file(open(lockPath.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
  if (!file.IsOpen()) ThrowLockError(editedPath, lockPath, ErrorText(errno));
  return file;
}

}  // namespace

EditLock::EditLock(const std::string& name, const std::string& editedPath)
    : file_(OpenLockFile(LockPath(name), editedPath)) {
  const std::string lockPath = LockPath(name);
  const auto deadline = std::chrono::steady_clock::now() + kLongestWait;
  while (flock(file_.Get(), LOCK_EX | LOCK_NB) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) ThrowLockError(editedPath, lockPath, ErrorText(errno));
    if (std::chrono::steady_clock::now() >= deadline) {
      ThrowLockError(editedPath, lockPath, "another process has held it for ten seconds");
    }
    std::this_thread::sleep_for(kPollInterval);
  }
}

}  // namespace HostMgmt::System
