/// Meeting points of threads, without sleeping for luck.
#ifndef SUPPORT_GATE_H
#define SUPPORT_GATE_H

#include <condition_variable>
#include <mutex>

namespace testsupport {

/// Closed at first; holds those who pass until it is opened, for good.
class Gate {
 public:
  /// Waits until the gate is open.
  void Pass() {
    std::unique_lock lock(mutex_);
    ++arrivals_;
    changed_.notify_all();
    changed_.wait(lock, [this] { return open_; });
  }

  void Open() {
    const std::lock_guard lock(mutex_);
    open_ = true;
    changed_.notify_all();
  }

  /// Waits until `count` threads have come to the gate, passed or not.
  void AwaitArrivals(int count) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [this, count] { return arrivals_ >= count; });
  }

 private:
  std::mutex mutex_;
  std::condition_variable changed_;
  bool open_ = false;
  int arrivals_ = 0;
};

}  // namespace testsupport

#endif  // SUPPORT_GATE_H
