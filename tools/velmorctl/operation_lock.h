/// One join or leave at a time.
#ifndef VELMORCTL_OPERATION_LOCK_H
#define VELMORCTL_OPERATION_LOCK_H

namespace velmorctl {

/// Held while the host's membership is changed; the system takes it away when the process ends.
class OperationLock {
 public:
  /// Does not wait. Throws Failure when another command holds the lock, or it cannot be made.
  OperationLock();
  OperationLock(const OperationLock&) = delete;
  OperationLock& operator=(const OperationLock&) = delete;
  ~OperationLock();

 private:
  int descriptor_;
};

}  // namespace velmorctl

#endif  // VELMORCTL_OPERATION_LOCK_H
