#include "errors/request_state.h"

#include <sys/time.h>

#include <cerrno>
#include <ctime>
#include <utility>

#include "authentication/library_exceptions.h"
#include "errors/thread_error.h"

namespace quenix::authentication {

namespace {

timespec DeadlineAfter(int seconds) {
  timeval now{};
  gettimeofday(&now, nullptr);
  return {now.tv_sec + seconds, now.tv_usec * 1000};
}

}  // namespace

RequestState::RequestState() {
  pthread_cond_init(&condition_, nullptr);
}

RequestState::~RequestState() {
  pthread_cond_destroy(&condition_);
}

void RequestState::Done(std::unique_ptr<Exception>&& outcome) {
  const MutexLock lock(mutex_);
  done_ = true;
  if (outcome) exception_ = std::move(outcome);
  pthread_cond_broadcast(&condition_);
}

void RequestState::WaitResult(int timeoutSeconds) {
  const timespec deadline = DeadlineAfter(timeoutSeconds);
  int result = 0;
  const Exception* failure = nullptr;
  {
    const MutexLock lock(mutex_);
    while (!done_ && result == 0) {
      result = pthread_cond_timedwait(&condition_, mutex_.Native(), &deadline);
    }
    failure = exception_.get();
  }
  if (result == ETIMEDOUT) throw ProviderCallTimedOutException();
  if (result != 0) {
    throw ThreadErrorException(ThreadErrorDetail("pthread_cond_timedwait failed. RC=", result));
  }
  // Read without the lock: a failure is stored once, before the request is done, and never replaced.
  if (failure != nullptr) failure->Throw();
}

}  // namespace quenix::authentication
