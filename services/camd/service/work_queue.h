// Work that is done by a few threads, in its order.
#ifndef CAMD_SERVICE_WORK_QUEUE_H
#define CAMD_SERVICE_WORK_QUEUE_H

#include <condition_variable>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

namespace camd {

// Does at most `workers` jobs at once and lets at most `longest` more wait. A job must not throw. Safe for
// use by several threads.
class WorkQueue {
 public:
  WorkQueue(unsigned int workers, size_t longest);
  WorkQueue(const WorkQueue&) = delete;
  WorkQueue& operator=(const WorkQueue&) = delete;
  // Does all jobs that were taken; blocks as long as they take.
  ~WorkQueue();

  // False when too many jobs wait.
  bool TryAdd(std::function<void()> job);

 private:
  void Work();

  const size_t workers_;
  const size_t longest_;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::deque<std::function<void()>> jobs_;
  size_t busy_ = 0;
  bool ending_ = false;
  std::vector<std::thread> threads_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_WORK_QUEUE_H
