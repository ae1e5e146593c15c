#include "signal_pipe.h"

#include <fcntl.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <system_error>

namespace velmorctl {

namespace {

std::atomic<int> writeEnd{-1};
static_assert(std::atomic<int>::is_always_lock_free, "a signal handler reads it");

void PutIntoPipe(int signalNumber) {
  int savedErrno = errno;
  auto byte = static_cast<unsigned char>(signalNumber);
  // A full pipe holds more signals than anybody will look at.
  [[maybe_unused]] ssize_t written = write(writeEnd.load(), &byte, 1);
  errno = savedErrno;
}

}  // namespace

SignalPipe::SignalPipe(std::initializer_list<int> signalNumbers) {
  int ends[2];
  if (pipe2(ends, O_CLOEXEC | O_NONBLOCK) != 0) {
    throw std::system_error(errno, std::generic_category(), "pipe2");
  }
  readEnd_ = ends[0];
  writeEnd = ends[1];
  previousActions_.reserve(signalNumbers.size());
  for (int signalNumber : signalNumbers) {
    struct sigaction previous = {};
    sigaction(signalNumber, nullptr, &previous);
    if (previous.sa_handler == SIG_IGN) {
      continue;
    }
    struct sigaction action = {};
    action.sa_handler = PutIntoPipe;
    action.sa_flags = SA_RESTART;
    sigemptyset(&action.sa_mask);
    sigaction(signalNumber, &action, nullptr);
    previousActions_.emplace_back(signalNumber, previous);
  }
}

SignalPipe::~SignalPipe() {
  for (const auto& [signalNumber, previous] : previousActions_) {
    sigaction(signalNumber, &previous, nullptr);
  }
  close(writeEnd.exchange(-1));
  close(readEnd_);
}

std::optional<int> SignalPipe::Take() {
  unsigned char byte = 0;
  if (read(readEnd_, &byte, 1) != 1) {
    return std::nullopt;
  }
  return byte;
}

void IgnoreBrokenPipes() {
  signal(SIGPIPE, SIG_IGN);
}

}  // namespace velmorctl
