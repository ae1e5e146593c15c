/// The control field of a policy line: what each answer of a module does to the stack's verdict.
#ifndef VELMORCTL_PAM_CONTROL_H
#define VELMORCTL_PAM_CONTROL_H

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

#include "pam/return_code.h"

namespace velmorctl::pam {

struct Action {
  enum class Kind : std::uint8_t { Ignore, Ok, Done, Bad, Die, Reset, Jump };

  Kind kind = Kind::Bad;
  std::int32_t jump = 0;  /// the modules to pass over; of Kind::Jump only

  bool operator==(const Action&) const = default;
};

/// The word or number of a bracketed control.
std::string NameOf(Action action);

/// The actions for the answers, by the number of the answer.
using Actions = std::array<Action, returnCodeCount>;

/// The action for the answer; Bad for one without a name.
Action ActionFor(const Actions& actions, ReturnCode answer);

struct Control {
  enum class Kind { Keyword, Bracketed, Include, Substack, Invalid };

  Kind kind = Kind::Invalid;
  Actions actions;      /// of Include and Substack: all Bad, which count when the file cannot be read
  std::string problem;  /// of Invalid: what is wrong; libpam then treats every answer as bad
};

/// Reads a control as libpam does: keywords whatever their case, or a list of value=action without its
/// brackets. Deliberate: libpam takes such a list without brackets too, when it is one word, and a keyword
/// within brackets; values and actions need not be separated.
Control ReadControl(std::string_view text);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_CONTROL_H
