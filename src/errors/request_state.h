/// Where callers wait for a provider request that runs elsewhere.
#ifndef ERRORS_REQUEST_STATE_H
#define ERRORS_REQUEST_STATE_H

#include <pthread.h>

#include <memory>

#include "authentication/exception.h"
#include "errors/mutex.h"

namespace quenix::authentication {

/// The outcome of one provider request: pending at first, then done, with a failure or without.
///
/// Held by a shared pointer, so that it outlives both the worker and those who wait. The request's answer is
/// not kept here: it is in the cache before the request is done.
class RequestState {
 public:
  RequestState();
  RequestState(const RequestState&) = delete;
  RequestState& operator=(const RequestState&) = delete;
  ~RequestState();

  /// Marks the request done and wakes all who wait; null is success. Called once, by the request's worker.
  void Done(std::unique_ptr<Exception>&& outcome);

  /// Waits until the request is done, no longer than `timeoutSeconds` by the wall clock, and throws a copy of
  /// its failure if it has one. Throws ProviderCallTimedOutException when the time is over, even if the
  /// request is done at that moment, and ThreadErrorException when waiting fails. Any number of threads may
  /// wait.
  void WaitResult(int timeoutSeconds);

 private:
  bool done_ VELMOR_GUARDED_BY(mutex_) = false;
  std::unique_ptr<Exception> exception_ VELMOR_GUARDED_BY(mutex_);
  Mutex mutex_;
  pthread_cond_t condition_;
};

}  // namespace quenix::authentication

#endif  // ERRORS_REQUEST_STATE_H
