#ifndef SYSTEMCONFIGURATION_PAM_ENTRY_H
#define SYSTEMCONFIGURATION_PAM_ENTRY_H

#include <iosfwd>
#include <list>
#include <string>

#include "systemconfiguration/export.h"
#include "systemconfiguration/pam_control.h"

namespace SystemConfiguration {

/// One line of a PAM policy without its facility: control, module and the module's parameters.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it.
class SYSTEMCONFIGURATION_EXPORT PAMEntry {
 public:
  /// `Unset` control, empty module, no parameters.
  PAMEntry();

  /// No parameters.
  PAMEntry(PAMControl control, std::string module);

  const PAMControl& control() const;

  /// The module's path or name as written.
  const std::string& module() const;

  /// The module's arguments in order, one word each, to be read and changed in place.
  std::list<std::string>& parameters();
  const std::list<std::string>& parameters() const;

  /// Equal controls, modules and parameters. Deliberate: controls are compared by value only, so that two
  /// bracketed controls count as equal whatever their texts.
  bool operator==(const PAMEntry& other) const;

 private:
  friend SYSTEMCONFIGURATION_EXPORT std::istream& operator>>(std::istream& stream, PAMEntry& entry);

  PAMControl control_;
  std::string module_;
  std::list<std::string> parameters_;
};

/// Writes control, module and parameters on one line, without a line end. Deliberate: a tab follows the
/// module and a blank follows each parameter, the last ones included. Throws InvalidControlException, with
/// nothing written, when the control has no keyword.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const PAMEntry& entry);

/// Reads an entry and the rest of its line from behind the facility word. Deliberate: control and module are
/// looked for across line ends, only the parameters end with the line; parameters are appended to those that
/// the entry already has; quotes, brackets, backslashes and '#' mean nothing among them.
/// Throws InvalidControlException for an unknown, missing or unclosed control; the entry is unchanged then.
SYSTEMCONFIGURATION_EXPORT std::istream& operator>>(std::istream& stream, PAMEntry& entry);

}  // namespace SystemConfiguration

#endif
