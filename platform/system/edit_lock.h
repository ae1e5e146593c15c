#ifndef PLATFORM_SYSTEM_EDIT_LOCK_H
#define PLATFORM_SYSTEM_EDIT_LOCK_H

#include <string>

#include "velmor/unique_fd.h"

namespace HostMgmt::System {

/// Held while a file is read, changed and replaced, so that no thread and no process using this layer
/// overwrites the change of another. Released by its destructor, and by the kernel when the process dies.
class EditLock {
 public:
  /// Takes the lock /run/quenix/<name>.lock, which only the host's administrator can take (so nobody else
  /// can hold up an edit). Waits at most ten seconds. Throws Lib::HostMgmtException "Unable to change
  /// '<editedPath>': <reason>".
  EditLock(const std::string& name, const std::string& editedPath);

 private:
  velmor::UniqueFd file_;
};

}  // namespace HostMgmt::System

#endif
