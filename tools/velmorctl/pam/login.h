/// Whether a login would succeed, and why.
#ifndef VELMORCTL_PAM_LOGIN_H
#define VELMORCTL_PAM_LOGIN_H

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include "pam/module_answer.h"
#include "pam/simulator.h"
#include "pam/stack.h"

namespace velmorctl::pam {

/// An answer that is to be taken for that of a module.
struct AnswerOverride {
  std::optional<Facility> facility;  /// in this stack only
  std::string module;                /// as by ModuleName()
  std::size_t occurrence = 0;        /// of the module in its stack, counted from 1; 0 for each
  ReturnCode answer = ReturnCode::Success;
};

/// Reads [FACILITY:]MODULE[#OCCURRENCE]=ANSWER, for example "auth:pam_unix#2=auth_err".
std::optional<AnswerOverride> ReadAnswerOverride(const std::string& text);

/// One call of the program to libpam.
struct LoginCall {
  Operation operation = Operation::Authenticate;
  Verdict verdict;
  std::vector<std::string> notes;  /// one for each step of the trace; may be empty
};

struct LoginOutcome {
  bool succeeds = false;
  std::vector<LoginCall> calls;  /// up to the one that failed
  std::string reason;
};

/// Calls what a login program does: authenticate, account, set credentials, open the session; the first
/// failure ends it. When the account asks for a new password, it is changed before the login goes on.
LoginOutcome SimulateLogin(const Policy& policy, const Circumstances& circumstances,
                           const std::vector<AnswerOverride>& overrides);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_LOGIN_H
