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
  std::string reason;              /// what made the verdict what it is
};

/// Which calls a login consists of.
enum class LoginExtent {
  Admission,   /// those that decide whether the user may come in: authenticate and account
  OwnSession,  /// those for which the service has a stack, where the session is concerned: a program whose
               /// policy has no session lines is likely to open none
  Whole        /// all, whether the stacks are the service's own or those of "other"
};

struct LoginOutcome {
  bool succeeds = false;
  std::vector<LoginCall> calls;  /// up to the one that failed
  std::string reason;
};

/// Calls what a login program does: authenticate, account, set credentials, open the session; the first
/// failure ends it. When the account asks for a new password, it is changed before the login goes on.
LoginOutcome SimulateLogin(const Policy& policy, const Circumstances& circumstances,
                           const std::vector<AnswerOverride>& overrides,
                           LoginExtent extent = LoginExtent::Whole);

/// Makes every call that a program may make, whatever the others come to: authenticate, account, change the
/// password, open the session. Their second halves (set credentials, change after the first round, close)
/// come only behind first ones that succeed. In the end it sets credentials without authenticating before, as
/// for a login with a key.
std::vector<LoginCall> SimulateEachCall(const Policy& policy, const Circumstances& circumstances,
                                        const std::vector<AnswerOverride>& overrides);

/// Why libpam cannot use a policy that is not Usable.
std::string WhyUnusable(const Policy& policy);

}  // namespace velmorctl::pam

#endif  // VELMORCTL_PAM_LOGIN_H
