/// How the library starts the provider calls that must not hold their caller.
#ifndef AUTHENTICATION_THREAD_UTIL_H
#define AUTHENTICATION_THREAD_UTIL_H

#include <functional>

#include "authentication/export.h"

namespace quenix::authentication {

/// Runs work away from the caller's thread: on a new detached thread, or where the host's own scheduler puts
/// it.
class VELMOR_EXPORT VelmorThreadUtil {
 public:
  VelmorThreadUtil() = delete;

  /// Installs the host's scheduler, which receives every piece of work from then on; an empty callable
  /// removes it.
  ///
  /// The scheduler must neither run the work on the calling thread nor wait for other work: it is called with
  /// a lock held that all work takes. Work of which the scheduler threw does nothing when it is run all the
  /// same. The work may throw, when a provider plug-in threw something that is not an Exception. A host that
  /// unloads the library must first have run and destroyed all work that it was given.
  ///
  /// No lock guards this: call it before the first store operation, and not while other threads use the
  /// library.
  static void SetScheduler(std::function<void(std::function<void()>)> scheduler);

  /// Runs `work` and does not wait for it. Without a scheduler it runs on a new detached thread, which keeps
  /// the library loaded until the thread has left it; an exception that leaves the work there ends the
  /// process.
  ///
  /// Safe to call from any thread. Throws ThreadErrorException when no thread can be started (the work is
  /// then discarded); what the scheduler throws goes to the caller.
  static void ScheduleFunctor(std::function<void()> work);
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_THREAD_UTIL_H
