// A limit on the time that a client may take.
#ifndef CAMD_SERVICE_CONNECTION_WATCH_H
#define CAMD_SERVICE_CONNECTION_WATCH_H

#include <chrono>
#include <condition_variable>
#include <map>
#include <mutex>
#include <thread>

namespace camd {

// Shuts connections down whose client has not sent a whole request, or has not taken its answer, within a
// time. The web server's own time-out starts anew with every byte, so a client that sends one now and then
// would keep its place for ever. Safe for use by several threads.
class ConnectionWatch {
 public:
  explicit ConnectionWatch(std::chrono::seconds limit);
  ConnectionWatch(const ConnectionWatch&) = delete;
  ConnectionWatch& operator=(const ConnectionWatch&) = delete;
  ~ConnectionWatch();

  // The client has its time from now on. The socket must stay open until Forget.
  void Start(int socket);
  // The client has done its part; it is our turn.
  void Pause(int socket);
  // The socket is about to be closed.
  void Forget(int socket);

 private:
  using Clock = std::chrono::steady_clock;

  void Watch();

  const std::chrono::seconds limit_;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::map<int, Clock::time_point> deadlines_;
  bool ending_ = false;
  std::thread thread_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_CONNECTION_WATCH_H
