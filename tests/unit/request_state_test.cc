#include "errors/request_state.h"

#include <gtest/gtest.h>
#include <sys/time.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "authentication/authentication.h"
#include "support/clock.h"
#include "support/expect_throw_what.h"
#include "support/gate.h"
#include "support/interpose.h"

namespace quenix::authentication {
namespace {

using testsupport::FakeClock;
using testsupport::TakeOver;

/// Makes each timed wait end with `result` at once, without giving up the mutex.
auto WaitsEndWith(int result) {
  return [result](pthread_cond_t*, pthread_mutex_t*, const timespec*) { return result; };
}

TEST(RequestStateTest, AWaiterThatComesAfterSuccessReturnsAtOnce) {
  RequestState state;
  state.Done(nullptr);
  state.WaitResult(0);
  state.WaitResult(60);
}

TEST(RequestStateTest, AWaiterThatComesAfterSuccessDoesNotWait) {
  RequestState state;
  state.Done(nullptr);
  int waits = 0;
  const TakeOver count(testsupport::calls::pthreadCondTimedwait, [&](auto...) {
    ++waits;
    return ETIMEDOUT;
  });
  state.WaitResult(60);
  EXPECT_EQ(waits, 0);
}

TEST(RequestStateTest, ATimeOutOfZeroIsOverAfterTheFirstWait) {
  RequestState state;
  int waits = 0;
  const TakeOver count(testsupport::calls::pthreadCondTimedwait,
                       [&](pthread_cond_t* condition, pthread_mutex_t* mutex, const timespec* deadline) {
                         ++waits;
                         return testsupport::calls::pthreadCondTimedwait.Real(condition, mutex, deadline);
                       });
  EXPECT_THROW_WHAT(state.WaitResult(0), ProviderCallTimedOutException, "Provider call timed out.");
  EXPECT_EQ(waits, 1);
}

TEST(RequestStateTest, AFailureIsThrownAsItsClassAndText) {
  RequestState state;
  state.Done(std::make_unique<LogonFailureException>());
  EXPECT_THROW_WHAT(
      state.WaitResult(60), LogonFailureException,
      "Exception 0x0000052e: The attempted logon is invalid. This is due to either a bad user name or "
      "authentication information.");
}

TEST(RequestStateTest, AFailureStaysForEveryLaterWaiter) {
  RequestState state;
  state.Done(std::make_unique<IOError>("failed"));
  EXPECT_THROW_WHAT(state.WaitResult(60), IOError, "failed");
  EXPECT_THROW_WHAT(state.WaitResult(60), IOError, "failed");
}

TEST(RequestStateTest, DoneTakesTheFailureOver) {
  RequestState state;
  std::unique_ptr<Exception> failure = std::make_unique<IOError>("failed");
  state.Done(std::move(failure));
  EXPECT_EQ(failure, nullptr);
}

TEST(RequestStateTest, ASecondSuccessLeavesTheStoredFailure) {
  RequestState state;
  state.Done(std::make_unique<IOError>("failed"));
  state.Done(nullptr);
  EXPECT_THROW_WHAT(state.WaitResult(60), IOError, "failed");
}

TEST(RequestStateTest, ASecondFailureReplacesTheStoredOne) {
  RequestState state;
  state.Done(std::make_unique<IOError>("failed"));
  state.Done(std::make_unique<ConfigurationError>("failed otherwise"));
  EXPECT_THROW_WHAT(state.WaitResult(60), ConfigurationError, "failed otherwise");
}

/// Starts waiters, and lets them all reach the wait before it goes on.
class Waiters {
 public:
  Waiters(RequestState& state, int count)
      : watch_(testsupport::calls::pthreadCondTimedwait,
               [this](pthread_cond_t* condition, pthread_mutex_t* mutex, const timespec* deadline) {
                 ++waiting_;
                 return testsupport::calls::pthreadCondTimedwait.Real(condition, mutex, deadline);
               }) {
    for (int index = 0; index < count; ++index) {
      threads_.emplace_back([this, &state] { Wait(state); });
    }
    while (waiting_ < count) {
      std::this_thread::yield();
    }
  }

  void Join() {
    for (std::thread& thread : threads_) {
      thread.join();
    }
  }

  int Succeeded() const { return succeeded_; }
  int Failed() const { return failed_; }

 private:
  void Wait(RequestState& state) {
    try {
      state.WaitResult(600);
      ++succeeded_;
    } catch (const InvalidKeyException& exception) {
      if (exception.what() == std::string("The specified key 'k' was not found in this configuration")) {
        ++failed_;
      }
    }
  }

  std::atomic<int> waiting_{0};
  std::atomic<int> succeeded_{0};
  std::atomic<int> failed_{0};
  TakeOver<int(pthread_cond_t*, pthread_mutex_t*, const timespec*)> watch_;
  std::vector<std::thread> threads_;
};

TEST(RequestStateTest, AllWaitersWakeOnSuccess) {
  RequestState state;
  Waiters waiters(state, 5);
  state.Done(nullptr);
  waiters.Join();
  EXPECT_EQ(waiters.Succeeded(), 5);
}

TEST(RequestStateTest, AllWaitersReceiveTheFailure) {
  RequestState state;
  Waiters waiters(state, 5);
  state.Done(std::make_unique<InvalidKeyException>("k"));
  waiters.Join();
  EXPECT_EQ(waiters.Failed(), 5);
  EXPECT_THROW(state.WaitResult(0), InvalidKeyException);
}

TEST(RequestStateTest, ATimeOutLeavesTheRequestPending) {
  RequestState state;
  EXPECT_THROW(state.WaitResult(0), ProviderCallTimedOutException);
  state.Done(nullptr);
  state.WaitResult(0);
}

TEST(RequestStateTest, DoneIsNotLookedAtAfterATimeOut) {
  RequestState state;
  const TakeOver finishThenTimeOut(testsupport::calls::pthreadCondTimedwait,
                                   [&](pthread_cond_t*, pthread_mutex_t* mutex, const timespec*) {
                                     pthread_mutex_unlock(mutex);
                                     state.Done(nullptr);
                                     pthread_mutex_lock(mutex);
                                     return ETIMEDOUT;
                                   });
  EXPECT_THROW_WHAT(state.WaitResult(60), ProviderCallTimedOutException, "Provider call timed out.");
}

TEST(RequestStateTest, ASpuriousWakeUpWaitsOnToTheSameDeadline) {
  RequestState state;
  FakeClock clock;
  std::vector<timespec> deadlines;
  const TakeOver wakeUp(testsupport::calls::pthreadCondTimedwait,
                        [&](pthread_cond_t*, pthread_mutex_t*, const timespec* deadline) {
                          deadlines.push_back(*deadline);
                          clock.MoveWallClock(std::chrono::seconds(10));
                          return deadlines.size() < 3 ? 0 : ETIMEDOUT;
                        });
  EXPECT_THROW(state.WaitResult(60), ProviderCallTimedOutException);
  ASSERT_EQ(deadlines.size(), 3U);
  EXPECT_EQ(deadlines[1].tv_sec, deadlines[0].tv_sec);
  EXPECT_EQ(deadlines[2].tv_sec, deadlines[0].tv_sec);
  EXPECT_EQ(deadlines[2].tv_nsec, deadlines[0].tv_nsec);
}

TEST(RequestStateTest, TheDeadlineIsTheWallClockPlusTheTimeOut) {
  RequestState state;
  FakeClock clock;
  clock.MoveWallClock(std::chrono::hours(100));
  timespec deadline{};
  const TakeOver look(testsupport::calls::pthreadCondTimedwait,
                      [&](pthread_cond_t*, pthread_mutex_t*, const timespec* time) {
                        deadline = *time;
                        return ETIMEDOUT;
                      });
  timeval before{};
  timeval after{};
  gettimeofday(&before, nullptr);
  EXPECT_THROW(state.WaitResult(25), ProviderCallTimedOutException);
  gettimeofday(&after, nullptr);
  EXPECT_GE(deadline.tv_sec, before.tv_sec + 25);
  EXPECT_LE(deadline.tv_sec, after.tv_sec + 25);
  EXPECT_EQ(deadline.tv_nsec % 1000, 0);
  EXPECT_LT(deadline.tv_nsec, 1'000'000'000);
}

TEST(RequestStateTest, TheDeadlineIsReadBeforeTheLockIsTaken) {
  RequestState state;
  FakeClock clock;
  std::vector<timespec> deadlines;
  std::thread second;
  const TakeOver look(testsupport::calls::pthreadCondTimedwait, [&](pthread_cond_t*, pthread_mutex_t*,
                                                                    const timespec* deadline) {
    deadlines.push_back(*deadline);
    if (deadlines.size() == 1) {
      // This waiter holds the lock. The second one must have read the clock all the same.
      second = std::thread([&] { EXPECT_THROW(state.WaitResult(60), ProviderCallTimedOutException); });
      const auto limit = std::chrono::steady_clock::now() + std::chrono::seconds(20);
      while (clock.WallClockReads() < 2 && std::chrono::steady_clock::now() < limit) {
        std::this_thread::yield();
      }
      clock.MoveWallClock(std::chrono::hours(1));
    }
    return ETIMEDOUT;
  });
  EXPECT_THROW(state.WaitResult(60), ProviderCallTimedOutException);
  second.join();
  ASSERT_EQ(deadlines.size(), 2U);
  EXPECT_LT(deadlines[1].tv_sec, deadlines[0].tv_sec + 3600);
}

TEST(RequestStateTest, AMovedWallClockEndsAWaitAtOnce) {
  RequestState state;
  FakeClock clock;
  clock.MoveWallClock(std::chrono::hours(-1));
  EXPECT_THROW(state.WaitResult(60), ProviderCallTimedOutException);
}

TEST(RequestStateTest, AFailedWaitDropsAsManyCharactersAsItsResult) {
  RequestState state;
  const TakeOver fail(testsupport::calls::pthreadCondTimedwait, WaitsEndWith(22));
  EXPECT_THROW_WHAT(state.WaitResult(60), ThreadErrorException, "Thread Error:  failed. RC=");
}

TEST(RequestStateTest, AFailedWaitWithAResultBeyondTheTextHasNoDetail) {
  RequestState state;
  const TakeOver fail(testsupport::calls::pthreadCondTimedwait, WaitsEndWith(4000));
  EXPECT_THROW_WHAT(state.WaitResult(60), ThreadErrorException, "Thread Error: ");
}

TEST(RequestStateTest, AFailedWaitWithAResultOfTheTextsLengthHasNoDetail) {
  RequestState state;
  // "pthread_cond_timedwait failed. RC=" has 34 characters.
  const TakeOver fail(testsupport::calls::pthreadCondTimedwait, WaitsEndWith(34));
  EXPECT_THROW_WHAT(state.WaitResult(60), ThreadErrorException, "Thread Error: ");
}

/// Whether `mutex`, which the library gave to a timed wait, is free.
bool IsFree(pthread_mutex_t* mutex) {
  const bool free = pthread_mutex_trylock(mutex) == 0;
  if (free) {
    pthread_mutex_unlock(mutex);
  }
  return free;
}

TEST(RequestStateTest, TheMutexIsFreeAfterATimeOutAndAfterAFailedWait) {
  RequestState state;
  pthread_mutex_t* used = nullptr;
  for (const int result : {ETIMEDOUT, EINVAL}) {
    const TakeOver end(testsupport::calls::pthreadCondTimedwait,
                       [&](pthread_cond_t*, pthread_mutex_t* mutex, const timespec*) {
                         used = mutex;
                         return result;
                       });
    EXPECT_THROW(state.WaitResult(60), Exception);
    ASSERT_NE(used, nullptr);
    EXPECT_TRUE(IsFree(used));
  }
}

TEST(RequestStateTest, TheMutexIsFreeAfterAStoredFailure) {
  RequestState state;
  pthread_mutex_t* used = nullptr;
  const TakeOver finish(testsupport::calls::pthreadCondTimedwait,
                        [&](pthread_cond_t*, pthread_mutex_t* mutex, const timespec*) {
                          used = mutex;
                          pthread_mutex_unlock(mutex);
                          state.Done(std::make_unique<IOError>("failed"));
                          pthread_mutex_lock(mutex);
                          return 0;
                        });
  EXPECT_THROW(state.WaitResult(60), IOError);
  ASSERT_NE(used, nullptr);
  EXPECT_TRUE(IsFree(used));
}

}  // namespace
}  // namespace quenix::authentication
