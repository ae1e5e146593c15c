// Programs that the service and its helper start: without a shell, with nothing of ours open in them, and
// ended at a deadline.
#ifndef CAMD_COMMON_CHILD_H
#define CAMD_COMMON_CHILD_H

#include <chrono>
#include <string>
#include <string_view>

#include "common/unique_fd.h"

namespace camd {

using Deadline = std::chrono::steady_clock::time_point;

// Waits until the descriptor has one of the events of poll(2) or the deadline has come; false for the latter.
bool WaitFor(int descriptor, short events, Deadline deadline);

// A running program that leads a session of its own; its standard input and output are one socket, whose
// other end is here, and its errors lead nowhere. When this ends, the program and all others of its session
// have been killed and it has been collected. Any thread may own one; one thread at a time may use it.
class Child {
 public:
  // Starts the program `path`. Throws Failure (kInternalError) when it cannot be started.
  explicit Child(const std::string& path);
  Child(const Child&) = delete;
  Child& operator=(const Child&) = delete;
  ~Child();

  // Sends everything; false when the other side has gone or the deadline came first.
  bool Send(std::string_view bytes, Deadline deadline);

  // Receives at least one and at most `size` bytes; returns how many, or 0 when the other side has gone.
  // Throws Failure (kTimeout) at the deadline.
  size_t Receive(char* bytes, size_t size, Deadline deadline);

 private:
  UniqueFd socket_;
  pid_t process_ = -1;
};

}  // namespace camd

#endif  // CAMD_COMMON_CHILD_H
