/// How libpam runs a stack: from the modules' answers to the verdict.
#ifndef VELMORCTL_PAM_SIMULATOR_H
#define VELMORCTL_PAM_SIMULATOR_H

#include <cstddef>
#include <functional>
#include <optional>
#include <string_view>
#include <vector>

#include "pam/return_code.h"
#include "pam/stack.h"

namespace velmorctl::pam {

/// What a program asks of libpam. A change of password is asked for in two rounds.
enum class Operation {
  Authenticate,
  SetCredentials,
  ManageAccount,
  OpenSession,
  CloseSession,
  PrepareTokenChange,
  ChangeToken
};

/// The function of libpam, such as "pam_authenticate".
std::string_view NameOf(Operation operation);

/// The facility whose stack the operation runs.
Facility FacilityFor(Operation operation);

/// What the module of an entry answers; not asked for entries that call no module.
using Answers = std::function<ReturnCode(const StackEntry& entry, std::size_t index, Operation operation)>;

/// What one entry did to the verdict.
struct Step {
  std::size_t entry = 0;  /// index in the stack
  ReturnCode answer = ReturnCode::Success;
  Action action;         /// the one that counted
  bool frozen = false;   /// the action was chosen by another answer, that to the operation before
  bool badJump = false;  /// a jump that leads out of the stack or substack
  bool decided = false;  /// it changed how the verdict stands
  ReturnCode verdict = ReturnCode::PermissionDenied;  /// how it stands after the entry
};

struct Verdict {
  ReturnCode code = ReturnCode::PermissionDenied;
  std::vector<Step> trace;
};

/// The answers to pam_authenticate and pam_open_session, which later choose the path through the same stack
/// for pam_setcred and pam_close_session. One for each stack and login.
using FrozenChain = std::vector<std::optional<ReturnCode>>;

/// Runs the stack once. SetCredentials and CloseSession go by the chain that the operation before them has
/// left, or fill it when there is none; the others fill it anew. A stack without entries is refused.
Verdict Simulate(const Stack& stack, Operation operation, const Answers& answers, FrozenChain& chain);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_SIMULATOR_H
