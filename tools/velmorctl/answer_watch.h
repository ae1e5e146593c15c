/// Tells answers of the provider from answers of the cache.
#ifndef VELMORCTL_ANSWER_WATCH_H
#define VELMORCTL_ANSWER_WATCH_H

#include <chrono>
#include <functional>
#include <future>
#include <memory>
#include <optional>
#include <utility>

namespace velmorctl {

/// A value, and whether the provider gave it just now; if not, it is what the library's cache held.
template <class T>
struct Answer {
  T value{};
  bool live = false;
};

/// Installs a scheduler in the library that runs each piece of provider work on a thread and notes its end.
/// The library answers a question from its cache when the work has not ended in time, without saying so;
/// this class tells it from the notes. One object may exist at a time, and it is used by one thread.
///
/// A thread whose work hangs is left behind; then the process must end without running destructors of static
/// objects (see WorkRuns()).
class AnswerWatch {
 public:
  /// `timeout` is what the store that is asked was built with.
  explicit AnswerWatch(std::chrono::seconds timeout);
  AnswerWatch(const AnswerWatch&) = delete;
  AnswerWatch& operator=(const AnswerWatch&) = delete;
  ~AnswerWatch();

  /// Asks one of the store's questions; what it throws goes to the caller.
  template <class Question>
  auto Ask(Question question) -> Answer<decltype(question())> {
    Begin();
    Answer<decltype(question())> answer{question(), false};
    answer.live = WasLive();
    return answer;
  }

  /// Calls an operation of the store that has no time-out of its own, on a thread, and waits no longer for
  /// it than for a question; nothing when it has not ended by then. What it throws goes to the caller.
  template <class Operation>
  auto Call(Operation operation) -> std::optional<decltype(operation())> {
    auto task = std::make_shared<std::packaged_task<decltype(operation())()>>(std::move(operation));
    auto result = task->get_future();
    Schedule([task] { (*task)(); });
    if (result.wait_for(timeout_) != std::future_status::ready) {
      return std::nullopt;
    }
    return result.get();
  }

  /// Whether any work of this process still runs.
  static bool WorkRuns();

 private:
  static void Schedule(std::function<void()> work);
  void Begin();
  bool WasLive() const;

  std::chrono::seconds timeout_;
  std::chrono::steady_clock::time_point begun_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_ANSWER_WATCH_H
