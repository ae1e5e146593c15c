#include "service/connection_watch.h"

#include <sys/socket.h>

namespace camd {
namespace {

// How exactly the limit is kept.
constexpr std::chrono::milliseconds kInterval(250);

}  // namespace

ConnectionWatch::ConnectionWatch(std::chrono::seconds limit) : limit_(limit), thread_([this] { Watch(); }) {}

ConnectionWatch::~ConnectionWatch() {
  {
    const std::lock_guard lock(mutex_);
    ending_ = true;
  }
  changed_.notify_all();
  thread_.join();
}

void ConnectionWatch::Start(int socket) {
  const std::lock_guard lock(mutex_);
  deadlines_[socket] = Clock::now() + limit_;
}

void ConnectionWatch::Pause(int socket) {
  Forget(socket);
}

void ConnectionWatch::Forget(int socket) {
  const std::lock_guard lock(mutex_);
  deadlines_.erase(socket);
}

void ConnectionWatch::Watch() {
  std::unique_lock lock(mutex_);
  while (!changed_.wait_for(lock, kInterval, [this] { return ending_; })) {
    const Clock::time_point now = Clock::now();
    for (auto& [socket, deadline] : deadlines_) {
      if (deadline > now) continue;
      // The web server sees the end of the stream, and closes.
      shutdown(socket, SHUT_RDWR);
      deadline = Clock::time_point::max();
    }
  }
}

}  // namespace camd
