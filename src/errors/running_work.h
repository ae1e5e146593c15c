/// Whether any work still runs that touches the process-wide state.
#ifndef ERRORS_RUNNING_WORK_H
#define ERRORS_RUNNING_WORK_H

#include <atomic>

namespace quenix::authentication {

/// Held by each piece of work from the moment it is handed out until it is destroyed.
class RunningWork {
 public:
  RunningWork() noexcept { ++count_; }
  RunningWork(const RunningWork&) noexcept { ++count_; }
  RunningWork& operator=(const RunningWork&) = delete;
  ~RunningWork() { --count_; }

  /// Whether no work is left.
  static bool NoneLeft() noexcept { return count_ == 0; }

 private:
  static std::atomic<int> count_;
};

}  // namespace quenix::authentication

#endif  // ERRORS_RUNNING_WORK_H
