#ifndef SYSTEMCONFIGURATION_PAM_STACK_H
#define SYSTEMCONFIGURATION_PAM_STACK_H

#include <deque>
#include <iosfwd>
#include <string>

#include "systemconfiguration/export.h"
#include "systemconfiguration/pam_entry.h"
#include "systemconfiguration/pam_facility.h"

namespace SystemConfiguration {

/// All lines of one facility of a PAM policy, in file order: a double-ended queue that knows its facility.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it. It must not be deleted through a pointer to the queue.
class SYSTEMCONFIGURATION_EXPORT PAMStack : public std::deque<PAMEntry> {
 public:
  /// An empty stack of the facility `Unset`.
  PAMStack();

  /// An empty stack.
  explicit PAMStack(const PAMFacility& facility);

  PAMFacility Facility() const;

  /// The first entry of exactly this module, or end().
  iterator find(const std::string& module);
  const_iterator find(const std::string& module) const;

 private:
  PAMFacility facility_;
};

/// Writes one line for each entry, in order, and flushes after each.
/// Throws InvalidFacilityException or InvalidControlException when an entry cannot be named; the lines before
/// it, and of its own line what stands before the missing word, are written then.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const PAMStack& stack);

}  // namespace SystemConfiguration

#endif
