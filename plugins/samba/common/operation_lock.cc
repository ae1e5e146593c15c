#include "common/operation_lock.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <string>
#include <thread>

#include "common/files.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr std::chrono::milliseconds kPatience{3000};
constexpr std::chrono::milliseconds kPause{20};

}  // namespace

OperationLock::OperationLock() {
  if (geteuid() != 0) throw Failure(kAccessDenied, "only root may change the host's membership");
  MakeFolder("/var/lib/quenix", 0755);
  MakeFolder(paths::kStateFolder, 0755);
  file_ = velmor::UniqueFd(open(paths::kLock, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
  if (!file_.IsOpen())
    throw Failure(kInternalError, std::string("cannot open ") + paths::kLock + ": " + ErrorText(errno));
  const auto deadline = std::chrono::steady_clock::now() + kPatience;
  while (flock(file_.Get(), LOCK_EX | LOCK_NB) != 0) {
    if (errno != EWOULDBLOCK && errno != EINTR) {
      throw Failure(kInternalError, std::string("cannot lock ") + paths::kLock + ": " + ErrorText(errno));
    }
    if (std::chrono::steady_clock::now() >= deadline) {
      throw Failure(kBusy, "another join, leave or change of this host runs at the moment");
    }
    std::this_thread::sleep_for(kPause);
  }
}

}  // namespace sambaprovider
