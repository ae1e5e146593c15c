#include "common/child.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "common/status.h"

namespace camd {
namespace {

// What posix_spawn needs, released at the end.
class SpawnPlan {
 public:
  explicit SpawnPlan(int socket) {
    posix_spawn_file_actions_init(&actions_);
    posix_spawn_file_actions_adddup2(&actions_, socket, 0);
    posix_spawn_file_actions_adddup2(&actions_, socket, 1);
    posix_spawn_file_actions_addopen(&actions_, 2, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addclosefrom_np(&actions_, 3);
    sigset_t none;
    sigset_t all;
    sigemptyset(&none);
    sigfillset(&all);
    posix_spawnattr_init(&attributes_);
    posix_spawnattr_setsigmask(&attributes_, &none);
    posix_spawnattr_setsigdefault(&attributes_, &all);
    posix_spawnattr_setflags(&attributes_,
                             POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSID);
  }
  SpawnPlan(const SpawnPlan&) = delete;
  SpawnPlan& operator=(const SpawnPlan&) = delete;
  ~SpawnPlan() {
    posix_spawn_file_actions_destroy(&actions_);
    posix_spawnattr_destroy(&attributes_);
  }

  pid_t Start(std::string path) const {
    std::string search = "PATH=/usr/sbin:/usr/bin:/sbin:/bin";
    std::string locale = "LC_ALL=C";
    char* const arguments[] = {path.data(), nullptr};
    char* const environment[] = {search.data(), locale.data(), nullptr};
    pid_t process = -1;
    const int error = posix_spawn(&process, path.c_str(), &actions_, &attributes_, arguments, environment);
    if (error != 0) throw Failure(kInternalError, "cannot start " + path + ": " + ErrorText(error));
    return process;
  }

 private:
  posix_spawn_file_actions_t actions_;
  posix_spawnattr_t attributes_;
};

}  // namespace

bool WaitFor(int descriptor, short events, Deadline deadline) {
  using std::chrono::milliseconds;
  constexpr milliseconds kLongestWait = std::chrono::hours(1);
  pollfd entry = {descriptor, events, 0};
  for (;;) {
    const auto left = std::chrono::ceil<milliseconds>(deadline - std::chrono::steady_clock::now());
    const int ready =
        poll(&entry, 1, static_cast<int>(std::clamp(left, milliseconds(0), kLongestWait).count()));
    if (ready > 0) return true;
    if (ready == 0 && std::chrono::steady_clock::now() >= deadline) return false;
    if (ready < 0 && errno != EINTR) return false;
  }
}

Child::Child(const std::string& path) {
  std::array<int, 2> pair = {-1, -1};
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair.data()) != 0) {
    throw Failure(kInternalError, "cannot make a socket pair: " + ErrorText(errno));
  }
  socket_ = UniqueFd(pair[0]);
  const UniqueFd theirs(pair[1]);
  process_ = SpawnPlan(theirs.Get()).Start(path);
}

// A process that was not collected yet keeps its number, so nobody else can be hit.
Child::~Child() {
  kill(-process_, SIGKILL);
  kill(process_, SIGKILL);
  while (waitpid(process_, nullptr, 0) < 0 && errno == EINTR) continue;
}

bool Child::Send(std::string_view bytes, Deadline deadline) {
  while (!bytes.empty()) {
    if (!WaitFor(socket_.Get(), POLLOUT, deadline)) return false;
    const ssize_t sent = send(socket_.Get(), bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
    if (sent < 0 && (errno == EINTR || errno == EAGAIN)) continue;
    if (sent < 0) return false;
    bytes.remove_prefix(static_cast<size_t>(sent));
  }
  return true;
}

size_t Child::Receive(char* bytes, size_t size, Deadline deadline) {
  for (;;) {
    if (!WaitFor(socket_.Get(), POLLIN, deadline)) {
      throw Failure(kTimeout, "the helper did not answer in time");
    }
    const ssize_t count = recv(socket_.Get(), bytes, size, MSG_DONTWAIT);
    if (count < 0 && (errno == EINTR || errno == EAGAIN)) continue;
    return count <= 0 ? 0 : static_cast<size_t>(count);
  }
}

}  // namespace camd
