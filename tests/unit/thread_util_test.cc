#include "authentication/thread_util.h"

#include <gtest/gtest.h>

#include <cerrno>
#include <functional>
#include <memory>
#include <stdexcept>
#include <thread>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "support/expect_throw_what.h"
#include "support/gate.h"
#include "support/interpose.h"

namespace quenix::authentication {
namespace {

using testsupport::Gate;
using testsupport::TakeOver;
namespace calls = testsupport::calls;

auto ThreadsAreRefusedWith(int result) {
  return [result](pthread_t*, const pthread_attr_t*, void* (*)(void*), void*) { return result; };
}

TEST(ThreadUtilTest, WorkRunsOnAnotherThread) {
  Gate gate;
  std::thread::id worker;
  VelmorThreadUtil::ScheduleFunctor([&] {
    worker = std::this_thread::get_id();
    gate.Open();
  });
  gate.Pass();
  EXPECT_NE(worker, std::this_thread::get_id());
}

TEST(ThreadUtilTest, TheCallerDoesNotWaitForTheWork) {
  Gate start;
  Gate end;
  VelmorThreadUtil::ScheduleFunctor([&] {
    start.Pass();
    end.Open();
  });
  start.Open();
  end.Pass();
}

TEST(ThreadUtilTest, TheThreadHasDefaultAttributesAndIsDetached) {
  Gate gate;
  bool defaults = false;
  int detached = 0;
  const TakeOver create(calls::pthreadCreate, [&](pthread_t* thread, const pthread_attr_t* attributes,
                                                  void* (*start)(void*), void* argument) {
    defaults = attributes == nullptr;
    return calls::pthreadCreate.Real(thread, attributes, start, argument);
  });
  const TakeOver detach(calls::pthreadDetach, [&](pthread_t thread) {
    ++detached;
    return calls::pthreadDetach.Real(thread);
  });
  VelmorThreadUtil::ScheduleFunctor([&] { gate.Open(); });
  gate.Pass();
  EXPECT_TRUE(defaults);
  EXPECT_EQ(detached, 1);
}

TEST(ThreadUtilTest, ARefusedThreadDropsAsManyCharactersAsItsResult) {
  const TakeOver refuse(calls::pthreadCreate, ThreadsAreRefusedWith(EAGAIN));
  EXPECT_THROW_WHAT(VelmorThreadUtil::ScheduleFunctor([] {}), ThreadErrorException,
                    "Thread Error: ate failed. RC=");
}

TEST(ThreadUtilTest, ARefusedThreadWithAResultBeyondTheTextHasNoDetail) {
  // "pthread_create failed. RC=" has 26 characters.
  for (const int result : {26, 27, 100000}) {
    const TakeOver refuse(calls::pthreadCreate, ThreadsAreRefusedWith(result));
    EXPECT_THROW_WHAT(VelmorThreadUtil::ScheduleFunctor([] {}), ThreadErrorException, "Thread Error: ");
  }
}

TEST(ThreadUtilTest, WorkThatCannotBeStartedIsDestroyedAndNeverRuns) {
  const TakeOver refuse(calls::pthreadCreate, ThreadsAreRefusedWith(EAGAIN));
  const auto token = std::make_shared<int>(0);
  bool ran = false;
  EXPECT_THROW(VelmorThreadUtil::ScheduleFunctor([&ran, token] { ran = true; }), ThreadErrorException);
  EXPECT_EQ(token.use_count(), 1);
  EXPECT_FALSE(ran);
}

TEST(ThreadUtilTest, WorkIsDestroyedWhenItHasRun) {
  Gate gate;
  struct OpensWhenDestroyed {
    Gate& gate;
    explicit OpensWhenDestroyed(Gate& opened) : gate(opened) {}
    OpensWhenDestroyed(const OpensWhenDestroyed&) = delete;
    OpensWhenDestroyed& operator=(const OpensWhenDestroyed&) = delete;
    ~OpensWhenDestroyed() { gate.Open(); }
  };
  VelmorThreadUtil::ScheduleFunctor([token = std::make_shared<OpensWhenDestroyed>(gate)] {});
  gate.Pass();
}

TEST(ThreadUtilTest, AnInstalledSchedulerReceivesTheWorkAndNoThreadIsStarted) {
  std::vector<std::function<void()>> received;
  int threads = 0;
  const TakeOver count(calls::pthreadCreate, [&](auto...) {
    ++threads;
    return EAGAIN;
  });
  VelmorThreadUtil::SetScheduler([&](std::function<void()> work) { received.push_back(std::move(work)); });
  bool ran = false;
  VelmorThreadUtil::ScheduleFunctor([&] { ran = true; });
  EXPECT_EQ(threads, 0);
  EXPECT_FALSE(ran);
  ASSERT_EQ(received.size(), 1U);
  received[0]();
  EXPECT_TRUE(ran);
  VelmorThreadUtil::SetScheduler(nullptr);
}

TEST(ThreadUtilTest, AnExceptionOfTheSchedulerGoesToTheCaller) {
  VelmorThreadUtil::SetScheduler([](std::function<void()>) { throw std::out_of_range("pool is full"); });
  EXPECT_THROW_WHAT(VelmorThreadUtil::ScheduleFunctor([] {}), std::out_of_range, "pool is full");
  VelmorThreadUtil::SetScheduler(nullptr);
}

TEST(ThreadUtilTest, AReplacedSchedulerIsDestroyed) {
  const auto token = std::make_shared<int>(0);
  VelmorThreadUtil::SetScheduler([token](std::function<void()>) {});
  EXPECT_EQ(token.use_count(), 2);
  VelmorThreadUtil::SetScheduler([](std::function<void()>) {});
  EXPECT_EQ(token.use_count(), 1);
  VelmorThreadUtil::SetScheduler(nullptr);
}

TEST(ThreadUtilTest, AnEmptySchedulerBringsTheThreadsBack) {
  bool used = false;
  VelmorThreadUtil::SetScheduler([&](std::function<void()>) { used = true; });
  VelmorThreadUtil::SetScheduler(std::function<void(std::function<void()>)>());
  Gate gate;
  VelmorThreadUtil::ScheduleFunctor([&] { gate.Open(); });
  gate.Pass();
  EXPECT_FALSE(used);
}

TEST(ThreadUtilDeathTest, EmptyWorkIsAnUnhandledBadFunctionCallOnTheWorker) {
  EXPECT_DEATH(
      {
        VelmorThreadUtil::ScheduleFunctor(std::function<void()>());
        Gate().Pass();
      },
      "bad_function_call");
}

TEST(ThreadUtilDeathTest, AnExceptionThatLeavesTheWorkEndsTheProcess) {
  EXPECT_DEATH(
      {
        VelmorThreadUtil::ScheduleFunctor([] { throw std::out_of_range("left the work"); });
        Gate().Pass();
      },
      "left the work");
}

}  // namespace
}  // namespace quenix::authentication
