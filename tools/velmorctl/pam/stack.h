/// What libpam runs for a service: one stack for each facility, with all included files put in.
#ifndef VELMORCTL_PAM_STACK_H
#define VELMORCTL_PAM_STACK_H

#include <array>
#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

#include "pam/control.h"
#include "pam/facility.h"

namespace velmorctl::pam {

struct Origin {
  std::string file;
  std::size_t line = 0;  /// counted from 1; 0 when no line is meant

  bool operator==(const Origin&) const = default;
};

struct StackEntry {
  enum class Kind {
    Module,      /// calls its module
    Substack,    /// stands before the entries of a substack, which have a higher level; answers "ignore"
    AlwaysFails  /// stands for a line that libpam cannot use: answers perm_denied
  };

  Kind kind = Kind::Module;
  std::size_t level = 0;  /// how many substacks it is in
  std::string control;    /// as it can be written in a file
  Actions actions;
  std::string module;  /// as it stands in the file; of a substack its file; may be empty for AlwaysFails
  std::vector<std::string> arguments;
  bool quiet = false;
  Origin origin;
};

/// The file name of a module without the folder and without ".so": "pam_unix" for both ways of writing it.
std::string ModuleName(std::string_view module);

using Stack = std::vector<StackEntry>;

/// Something that is wrong with a policy.
struct Finding {
  Origin origin;
  std::string value;  /// the text that is wrong; may be empty
  std::string reason;
  std::string remedy;

  bool operator==(const Finding&) const = default;
};

struct Policy {
  /// What libpam makes of the service as a whole.
  enum class State {
    Usable,   /// it runs the stacks
    Refused,  /// every call fails with "abort"; the stacks are empty
    Fatal     /// libpam crashes or never returns; the stacks are empty
  };

  std::string service;
  std::string file;  /// where the service is defined; empty when only "other" is
  State state = State::Usable;
  std::array<Stack, facilities.size()> stacks;
  std::array<bool, facilities.size()> fromOther = {};  /// the stack is that of the service "other"
  std::vector<Finding> findings;

  const Stack& StackOf(Facility facility) const { return stacks[static_cast<std::size_t>(facility)]; }
  bool IsFromOther(Facility facility) const { return fromOther[static_cast<std::size_t>(facility)]; }

  /// Whether the service itself has lines for the facility.
  bool HasOwn(Facility facility) const { return !StackOf(facility).empty() && !IsFromOther(facility); }
};

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_STACK_H
