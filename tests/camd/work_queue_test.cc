#include "service/work_queue.h"

#include <gtest/gtest.h>

#include <future>

namespace camd {
namespace {

TEST(WorkQueueTest, JobsThatWereTakenAreDoneBeforeItEnds) {
  std::atomic<int> done = 0;
  {
    WorkQueue queue(2, 10);
    for (int count = 0; count < 10; ++count) EXPECT_TRUE(queue.TryAdd([&done] { ++done; }));
  }
  EXPECT_EQ(done, 10);
}

TEST(WorkQueueTest, JobBehindAFullQueueIsNotTaken) {
  std::promise<void> gate;
  const std::shared_future<void> open = gate.get_future().share();
  WorkQueue queue(1, 1);
  EXPECT_TRUE(queue.TryAdd([open] { open.wait(); }));
  EXPECT_TRUE(queue.TryAdd([] {}));
  EXPECT_FALSE(queue.TryAdd([] {}));
  gate.set_value();
}

TEST(WorkQueueTest, AsManyJobsAsWorkersRunAtOnce) {
  std::promise<void> first;
  std::promise<void> second;
  WorkQueue queue(2, 0);
  EXPECT_TRUE(queue.TryAdd([&] {
    first.set_value();
    second.get_future().wait();
  }));
  EXPECT_TRUE(queue.TryAdd([&] {
    first.get_future().wait();
    second.set_value();
  }));
}

}  // namespace
}  // namespace camd
