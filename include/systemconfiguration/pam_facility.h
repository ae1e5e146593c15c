#ifndef SYSTEMCONFIGURATION_PAM_FACILITY_H
#define SYSTEMCONFIGURATION_PAM_FACILITY_H

#include <cstdint>
#include <iosfwd>
#include <string>

#include "systemconfiguration/export.h"

namespace SystemConfiguration {

/// The facility (management group) of a PAM policy line.
///
/// Converts from and to its value and its text without being asked, so that it can stand for either.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it.
class SYSTEMCONFIGURATION_EXPORT PAMFacility {
 public:
  /// Deliberate: the numbers order the stacks of a written policy, so `Account` comes before `Auth`.
  enum Facility : std::uint32_t { Unset = 0, Account = 1, Auth = 2, Password = 3, Session = 4 };

  /// `Unset`.
  PAMFacility();

  PAMFacility(Facility value);  // NOLINT(google-explicit-constructor): callers rely on it

  /// Reads a keyword; case matters. Throws InvalidFacilityException for any other word. Deliberate: a leading
  /// '-', by which a line tolerates a missing module, is not understood.
  PAMFacility(const std::string& word);  // NOLINT(google-explicit-constructor): callers rely on it

  PAMFacility& operator=(Facility value);

  /// Like the constructor from a word. Throws InvalidFacilityException; this object is unchanged then.
  PAMFacility& operator=(const std::string& word);

  bool operator==(const PAMFacility& other) const;
  bool operator==(Facility value) const;

  /// Reads the word as the constructor does and compares values. Throws InvalidFacilityException.
  bool operator==(const std::string& word) const;

  /// The keyword. Throws InvalidFacilityException for `Unset` and for values outside the enumeration.
  /// Deliberate: its message is "Invalid Facility: " less as many leading characters as the value says.
  operator std::string() const;  // NOLINT(google-explicit-constructor): callers rely on it

  /// The value.
  operator Facility() const;  // NOLINT(google-explicit-constructor): callers rely on it

 private:
  Facility value_;
};

/// Writes the keyword as one formatted string. Throws InvalidFacilityException when there is none.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const PAMFacility& facility);

/// Reads one word as a formatted string and assigns it. Throws InvalidFacilityException when it is no
/// facility, which the empty word of a stream that has nothing left is not either.
SYSTEMCONFIGURATION_EXPORT std::istream& operator>>(std::istream& stream, PAMFacility& facility);

}  // namespace SystemConfiguration

#endif
