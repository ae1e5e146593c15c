/// The lock that lets one change of the host's membership happen at a time, across processes.
#ifndef SAMBA_COMMON_OPERATION_LOCK_H
#define SAMBA_COMMON_OPERATION_LOCK_H

#include "velmor/unique_fd.h"

namespace sambaprovider {

/// Held while it exists; the kernel gives it back when the process ends, however it ends.
class OperationLock {
 public:
  /// Makes the provider's folders when they are absent. Waits up to three seconds for a holder that is about
  /// to end. Throws Failure: kBusy when another holds it, kAccessDenied when the caller may not change the
  /// host, kInternalError when the lock file cannot be used.
  OperationLock();

 private:
  velmor::UniqueFd file_;
};

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_OPERATION_LOCK_H
