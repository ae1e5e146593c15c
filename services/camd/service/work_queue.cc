#include "service/work_queue.h"

#include <utility>

namespace camd {

WorkQueue::WorkQueue(unsigned int workers, size_t longest) : workers_(workers), longest_(longest) {
  for (unsigned int count = 0; count < workers; ++count) threads_.emplace_back([this] { Work(); });
}

WorkQueue::~WorkQueue() {
  {
    const std::lock_guard lock(mutex_);
    ending_ = true;
  }
  changed_.notify_all();
  for (std::thread& thread : threads_) thread.join();
}

bool WorkQueue::TryAdd(std::function<void()> job) {
  {
    const std::lock_guard lock(mutex_);
    if (busy_ + jobs_.size() >= workers_ + longest_) return false;
    jobs_.push_back(std::move(job));
  }
  changed_.notify_one();
  return true;
}

void WorkQueue::Work() {
  std::unique_lock lock(mutex_);
  for (;;) {
    changed_.wait(lock, [this] { return ending_ || !jobs_.empty(); });
    if (jobs_.empty()) return;
    std::function<void()> job = std::move(jobs_.front());
    jobs_.pop_front();
    ++busy_;
    lock.unlock();
    job();
    job = nullptr;
    lock.lock();
    --busy_;
  }
}

}  // namespace camd
