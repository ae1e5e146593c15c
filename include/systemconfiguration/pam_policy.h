#ifndef SYSTEMCONFIGURATION_PAM_POLICY_H
#define SYSTEMCONFIGURATION_PAM_POLICY_H

#include <iosfwd>
#include <map>
#include <string>

#include "systemconfiguration/export.h"
#include "systemconfiguration/pam_facility.h"
#include "systemconfiguration/pam_stack.h"

namespace SystemConfiguration {

/// A PAM policy file, as the stacks of its facilities.
///
/// The model keeps the meaning of every policy line and the order of lines within a facility. It does not
/// keep comments, blank lines, spacing, or how the facilities' lines were mixed: a policy that was read and
/// is written again loses them.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it. Opening and replacing files is the caller's.
class SYSTEMCONFIGURATION_EXPORT PAMPolicy {
 public:
  /// A policy without stacks.
  explicit PAMPolicy(const std::string& name);

  /// The name given at construction, which is kept for the caller; it is neither read nor written.
  const std::string& name() const;

  /// The stack of a facility, put in empty when the policy had none. The reference stays valid as long as the
  /// policy lives and is not assigned to.
  PAMStack& operator[](PAMFacility facility);

 private:
  friend SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const PAMPolicy& policy);

  std::string name_;
  std::map<PAMFacility, PAMStack> stacks_;  // ordered by the facilities' numbers
};

/// Writes the header and then the stacks by the numbers of their facilities, each followed by a blank line,
/// an empty one too. Flushes after every line; may block as long as the stream's device does. Throws what
/// writing a stack throws; what stands before the fault is written then.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const PAMPolicy& policy);

/// Reads lines to the end of the stream and appends them to the stacks that the policy already has; a stream
/// that has failed before is left alone. Blank lines and lines that begin with '#' are passed over.
/// Afterwards the stream is at its end, and has also failed when the last line lacked its line end. Throws
/// InvalidFacilityException, with the stream just behind the offending word, and InvalidControlException; the
/// entries read before stay in the policy.
SYSTEMCONFIGURATION_EXPORT std::istream& operator>>(std::istream& stream, PAMPolicy& policy);

}  // namespace SystemConfiguration

#endif
