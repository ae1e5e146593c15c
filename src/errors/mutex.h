/// The library's one kind of lock.
#ifndef ERRORS_MUTEX_H
#define ERRORS_MUTEX_H

#include <pthread.h>

#include "authentication/thread_annotations.h"

namespace quenix::authentication {

/// A plain, non-recursive POSIX mutex with default attributes, known to clang's thread-safety analysis.
class VELMOR_CAPABILITY Mutex {
 public:
  Mutex() { pthread_mutex_init(&mutex_, nullptr); }
  Mutex(const Mutex&) = delete;
  Mutex& operator=(const Mutex&) = delete;
  ~Mutex() { pthread_mutex_destroy(&mutex_); }

  void Lock() VELMOR_ACQUIRE() { pthread_mutex_lock(&mutex_); }
  void Unlock() VELMOR_RELEASE() { pthread_mutex_unlock(&mutex_); }

  /// For waiting on a condition while this is locked.
  pthread_mutex_t* Native() { return &mutex_; }

 private:
  pthread_mutex_t mutex_;
};

/// Holds a mutex for the length of a block.
class VELMOR_SCOPED_CAPABILITY MutexLock {
 public:
  explicit MutexLock(Mutex& mutex) VELMOR_ACQUIRE(mutex) : mutex_(mutex) { mutex_.Lock(); }
  MutexLock(const MutexLock&) = delete;
  MutexLock& operator=(const MutexLock&) = delete;
  ~MutexLock() VELMOR_RELEASE() { mutex_.Unlock(); }

 private:
  Mutex& mutex_;
};

}  // namespace quenix::authentication

#endif  // ERRORS_MUTEX_H
