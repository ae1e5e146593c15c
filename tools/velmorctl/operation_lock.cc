#include "operation_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "failure.h"
#include "text.h"

namespace velmorctl {

namespace {

constexpr char directory[] = "/run/velmor";
constexpr char file[] = "/run/velmor/velmorctl.lock";

/// Who holds the lock, as the holder wrote it.
std::string Holder(int descriptor) {
  char digits[16] = {};
  ssize_t count = pread(descriptor, digits, sizeof(digits) - 1, 0);
  return count > 0 ? " (process " + Printable(digits) + ")" : "";
}

void WriteHolder(int descriptor) {
  std::string digits = std::to_string(getpid());
  // The number is for the message only, so a failure does no harm.
  if (ftruncate(descriptor, 0) == 0) {
    [[maybe_unused]] ssize_t written = pwrite(descriptor, digits.data(), digits.size(), 0);
  }
}

}  // namespace

OperationLock::OperationLock() {
  mkdir(directory, 0755);
  // Whoever may read it may lock it, and so keep root from joining and leaving.
  descriptor_ = open(file, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
  if (descriptor_ < 0) {
    throw Failure(ExitCode::HostNotReady,
                  std::string("cannot open '") + file + "': " + SystemErrorText(errno))
        .Try("make the directory of the file writable");
  }
  if (flock(descriptor_, LOCK_EX | LOCK_NB) != 0) {
    Failure failure(ExitCode::Conflict, "another velmorctl" + Holder(descriptor_) + " is joining or leaving");
    close(descriptor_);
    throw failure.Try("wait until it has ended");
  }
  WriteHolder(descriptor_);
}

OperationLock::~OperationLock() {
  close(descriptor_);
}

}  // namespace velmorctl
