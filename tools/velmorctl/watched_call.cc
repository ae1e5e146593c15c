#include "watched_call.h"

#include <poll.h>
#include <sys/eventfd.h>
#include <unistd.h>

#include <cerrno>
#include <future>
#include <memory>
#include <system_error>
#include <thread>

#include "failure.h"

namespace velmorctl {

namespace {

/// How often the passing time is shown.
constexpr int clockMilliseconds = 250;

/// A call on a thread of its own, with a descriptor that becomes readable at its end. Shared by the thread
/// and the one that waits, since either may outlast the other.
class BackgroundCall {
 public:
  explicit BackgroundCall(std::function<void()> call)
      : task_(std::move(call)), end_(task_.get_future()), ended_(eventfd(0, EFD_CLOEXEC)) {
    if (ended_ < 0) {
      throw std::system_error(errno, std::generic_category(), "eventfd");
    }
  }
  BackgroundCall(const BackgroundCall&) = delete;
  BackgroundCall& operator=(const BackgroundCall&) = delete;
  ~BackgroundCall() { close(ended_); }

  void Run() {
    task_();
    // What the call holds is let go before its end is known.
    task_ = {};
    eventfd_write(ended_, 1);
  }

  int Descriptor() const noexcept { return ended_; }

  std::exception_ptr Failure() {
    try {
      end_.get();
    } catch (...) {
      return std::current_exception();
    }
    return nullptr;
  }

 private:
  std::packaged_task<void()> task_;
  std::future<void> end_;
  int ended_;
};

/// A thread that is waited for with Join(), and otherwise left to itself.
class LeavableThread {
 public:
  explicit LeavableThread(std::function<void()> run) : thread_(std::move(run)) {}
  LeavableThread(const LeavableThread&) = delete;
  LeavableThread& operator=(const LeavableThread&) = delete;
  ~LeavableThread() {
    if (thread_.joinable()) {
      thread_.detach();
    }
  }

  void Join() { thread_.join(); }

 private:
  std::thread thread_;
};

}  // namespace

CallOutcome RunWatched(std::function<void()> call, Progress& progress, SignalPipe& signals,
                       const std::string& onSignal) {
  auto background = std::make_shared<BackgroundCall>(std::move(call));
  LeavableThread thread([background] { background->Run(); });
  pollfd waits[] = {{background->Descriptor(), POLLIN, 0}, {signals.Descriptor(), POLLIN, 0}};
  CallOutcome outcome;
  while (waits[0].revents == 0) {
    poll(waits, 2, clockMilliseconds);
    progress.Tick();
    std::optional<int> signalNumber = signals.Take();
    if (signalNumber && outcome.signalNumber) {
      throw Interrupted(*signalNumber,
                        "what had been started goes on without this command: look at "
                        "\"velmorctl status\" in some minutes");
    }
    if (signalNumber) {
      outcome.signalNumber = signalNumber;
      progress.Step(onSignal);
    }
  }
  // The libraries that the call used take their leave of the thread before the process may end.
  thread.Join();
  outcome.failure = background->Failure();
  return outcome;
}

}  // namespace velmorctl
