/// Keeps the library's code in memory while a worker thread runs in it.
#ifndef ERRORS_LIBRARY_PIN_H
#define ERRORS_LIBRARY_PIN_H

#include <pthread.h>

#include <climits>

namespace quenix::authentication {

/// A reference to the shared object that holds this code, as dlopen() counts them.
///
/// A thread cannot drop the last such reference while it executes the code itself. So a worker hands its
/// reference over with ReleaseAtThreadEnd(): the C library drops it when the thread has returned from all of
/// our code.
class LibraryPin {
 public:
  /// Takes a reference. Holds none where the code is not in a shared object, or is not known to the loader.
  LibraryPin() noexcept;
  LibraryPin(const LibraryPin&) = delete;
  LibraryPin& operator=(const LibraryPin&) = delete;

  /// Drops the reference, for a thread that was never started.
  ~LibraryPin();

  /// Lets the calling thread keep the reference until its end.
  void ReleaseAtThreadEnd() noexcept;

 private:
  void* library_;
};

/// The place where a thread keeps what it releases at its end; exists as long as the library is loaded. A
/// process has only so many of these: when there is none left, nothing can be kept.
class ThreadEndKey {
 public:
  ThreadEndKey() noexcept;
  ThreadEndKey(const ThreadEndKey&) = delete;
  ThreadEndKey& operator=(const ThreadEndKey&) = delete;
  ~ThreadEndKey();

  pthread_key_t Native() const noexcept { return key_; }

 private:
  // A number that no key can have: using and deleting it fails. 0 would be somebody else's key.
  pthread_key_t key_ = PTHREAD_KEYS_MAX;
};

/// The process's one key; see process_wide.cc.
extern const ThreadEndKey threadEndKey;

}  // namespace quenix::authentication

#endif  // ERRORS_LIBRARY_PIN_H
