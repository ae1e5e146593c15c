/// The fields of one line of a PAM policy, as libpam 1.5.2 takes them apart.
#ifndef VELMORCTL_PAM_POLICY_LINE_H
#define VELMORCTL_PAM_POLICY_LINE_H

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "pam/control.h"
#include "pam/facility.h"

namespace velmorctl::pam {

struct PolicyLine {
  enum class Kind {
    Module,       /// calls a module, or fails at once when it is no good (see Effect)
    Include,      /// "include": the lines of one facility of another file
    Substack,     /// "substack": the same, with a verdict and jumps of their own
    IncludeWhole  /// "@include": all lines of another file
  };

  /// What libpam makes of a line that has a problem.
  enum class Effect {
    Works,       /// it does what it says, or there is no problem
    AlwaysBad,   /// the module is called, and any answer counts as bad
    Fails,       /// no module is called: the line answers perm_denied
    WholeFails,  /// libpam refuses the whole service
    Crashes      /// libpam crashes, and the program that called it
  };

  Kind kind = Kind::Module;
  std::optional<Facility> facility;  /// none for IncludeWhole and when the word is none
  bool quiet = false;                /// "-" stands before the facility: a missing module is not logged
  std::string facilityWord;          /// as it stands in the file, without "-"
  std::string controlText;           /// as libpam takes it: without brackets and with "\]" as "]"
  bool bracketed = false;            /// the control was written in brackets
  Actions actions;
  std::string target;  /// the module, or the file to include
  std::vector<std::string> arguments;
  Effect effect = Effect::Works;
  std::string problem;       /// empty when there is none
  std::string problemValue;  /// the text that is wrong, as libpam takes it; may be empty

  /// The control as it can be written in a file.
  std::string Control() const;
};

/// Takes the text of a LogicalLine apart.
PolicyLine ReadPolicyLine(std::string_view text);

/// The word as one argument of a line: in brackets when it holds a blank or begins with a bracket.
std::string QuotedArgument(std::string_view argument);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_POLICY_LINE_H
