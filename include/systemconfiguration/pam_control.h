#ifndef SYSTEMCONFIGURATION_PAM_CONTROL_H
#define SYSTEMCONFIGURATION_PAM_CONTROL_H

#include <cstdint>
#include <string>

#include "systemconfiguration/export.h"

namespace SystemConfiguration {

/// The control field of a PAM policy line: one of six keywords, or a bracketed list of actions kept as text.
///
/// Converts from and to its value and its text without being asked, so that it can stand for either.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it.
class SYSTEMCONFIGURATION_EXPORT PAMControl {
 public:
  enum Control : std::uint32_t {
    Unset = 0,
    Required = 1,
    Requisite = 2,
    Sufficient = 3,
    Optional = 4,
    Include = 5,
    Substack = 6,
    Bracketed = 7
  };

  /// `Unset`, without text.
  PAMControl();

  /// The given value, without text.
  PAMControl(Control value);  // NOLINT(google-explicit-constructor): callers rely on it

  /// Stores both unchanged. Nothing checks that they fit each other.
  PAMControl(Control value, const std::string& text);

  /// Reads a keyword (case matters) or a bracketed control, whose whole text is kept and not examined.
  /// Throws InvalidControlException for anything else, the empty string included.
  PAMControl(const std::string& text);  // NOLINT(google-explicit-constructor): callers rely on it

  /// Sets the value only. Deliberate: the text stays, and counts again once the value is `Bracketed`.
  PAMControl& operator=(Control value);

  /// Like the constructor from text, but a keyword leaves the stored text as it was.
  /// Throws InvalidControlException; this object is unchanged then.
  PAMControl& operator=(const std::string& text);

  /// Equal values; two `Bracketed` controls also need the same text, byte for byte.
  bool operator==(const PAMControl& other) const;

  /// Equal values, whatever the text.
  bool operator==(Control value) const;

  /// Compares a `Bracketed` control's text with the given one byte for byte. Any other control reads the text
  /// as the constructor does and compares values. Throws InvalidControlException when this control is not
  /// `Bracketed` and the text is no control.
  bool operator==(const std::string& text) const;

#if __cplusplus < 202002L
  // Without these, C++17 would compare two controls by their values alone, through the conversion below. From
  // C++20 on the compiler derives them.
  bool operator!=(const PAMControl& other) const {
    return !(*this == other);
  }
  bool operator!=(Control value) const {
    return !(*this == value);
  }
  bool operator!=(const std::string& text) const {
    return !(*this == text);
  }
#endif

  /// The keyword, or a `Bracketed` control's text.
  /// Throws InvalidControlException for `Unset` and for values outside the enumeration. Deliberate: its
  /// message is "Invalid Control: " less as many leading characters as the value says.
  operator std::string() const;  // NOLINT(google-explicit-constructor): callers rely on it

  /// The value.
  operator Control() const;  // NOLINT(google-explicit-constructor): callers rely on it

 private:
  Control value_;
  std::string text_;
};

}  // namespace SystemConfiguration

#endif
