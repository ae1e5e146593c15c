#include "pam_edit/login_proof.h"

#include <algorithm>
#include <initializer_list>
#include <string_view>
#include <vector>

#include "pam/login.h"
#include "pam/module_answer.h"

namespace velmorctl::pam {

namespace {

using Code = ReturnCode;

constexpr char localModule[] = "pam_unix";

/// A login, in words and as what modules are told and answer.
struct Trial {
  std::string login;
  Circumstances circumstances;
  std::vector<AnswerOverride> answers;
};

AnswerOverride Given(const std::string& module, Code answer,
                     std::optional<Facility> facility = std::nullopt) {
  return {facility, ModuleName(module), 0, answer};
}

/// Modules that look at the circumstances of a login and at no password: what they answer is known.
constexpr std::string_view onlookers[] = {"pam_deny",   "pam_faillock", "pam_localuser", "pam_nologin",
                                          "pam_permit", "pam_rootok",   "pam_succeed_if"};

/// Whether success of the entry passes by the local users' module, as that of another way in does.
bool IsAnotherWayIn(const StackEntry& entry, const std::string& module) {
  std::string name = ModuleName(entry.module);
  Action::Kind success = ActionFor(entry.actions, Code::Success).kind;
  return (success == Action::Kind::Jump || success == Action::Kind::Done) && name != localModule &&
         name != ModuleName(module) && std::count(std::begin(onlookers), std::end(onlookers), name) == 0;
}

/// Nobody of whom the trials tell is known to other ways in. (Whom they know does not get to our lines.)
std::vector<AnswerOverride> OtherWaysIn(const Policy& policy, const std::string& module) {
  std::vector<AnswerOverride> answers;
  for (Facility facility : facilities) {
    for (const StackEntry& entry : policy.StackOf(facility)) {
      if (IsAnotherWayIn(entry, module)) {
        answers.push_back(Given(entry.module, Code::UserUnknown, facility));
      }
    }
  }
  return answers;
}

Circumstances CircumstancesOf(const Policy& policy, const Person& user, const std::string& module) {
  Circumstances circumstances;
  circumstances.user = user;
  circumstances.service = policy.service;
  circumstances.directoryModules = CommonDirectoryModules();
  circumstances.directoryModules.insert(ModuleName(module));
  // A module that is missing is missing before and after.
  circumstances.moduleExists = [](const std::string&) { return true; };
  circumstances.fileExists = [](const std::string&) { return false; };
  return circumstances;
}

std::vector<Person> LocalPeople() {
  return {LocalAdministrator(), Root()};
}

Person DirectoryUser() {
  return FindPerson("directory-user", {});
}

/// What a directory's module may answer when it cannot ask the directory, or is not there itself.
constexpr std::initializer_list<Code> failures = {Code::AuthenticationInformationUnavailable,
                                                  Code::ServiceError, Code::SystemError, Code::ModuleUnknown};

/// Logins of one person with one password, with all that the directory's module may answer.
void AddTrials(std::vector<Trial>& trials, const std::string& who, Circumstances circumstances,
               const std::string& module) {
  trials.push_back({who, circumstances, {}});
  trials.push_back({who + " whose account has expired",
                    circumstances,
                    {Given(localModule, Code::AccountExpired, Facility::Account)}});
  trials.push_back({who + ", though the directory has an account of the same name",
                    circumstances,
                    {Given(module, Code::Success, Facility::Auth)}});
  circumstances.directoryUp = false;
  for (Code failure : failures) {
    trials.push_back({who + ", while the directory's module answers " + NameOf(failure),
                      circumstances,
                      {Given(module, failure)}});
  }
}

std::vector<Trial> LocalTrials(const Policy& policy, const std::string& module) {
  std::vector<Trial> trials;
  for (const Person& person : LocalPeople()) {
    for (bool rightPassword : {true, false}) {
      Circumstances circumstances = CircumstancesOf(policy, person, module);
      circumstances.rightPassword = rightPassword;
      std::string who = (person.uid == 0 ? "root" : "a local user");
      AddTrials(trials, who + " with " + (rightPassword ? "the right" : "a wrong") + " password",
                circumstances, module);
    }
  }
  return trials;
}

/// Logins of a user of the directory that must fail.
std::vector<Trial> RefusedTrials(const Policy& policy, const std::string& module) {
  const std::string who = "a user of the directory";
  Circumstances circumstances = CircumstancesOf(policy, DirectoryUser(), module);
  std::vector<Trial> trials;
  for (Code refusal : {Code::AccountExpired, Code::PermissionDenied, Code::AuthenticationError}) {
    trials.push_back({who + ", though the directory refuses the account with " + NameOf(refusal),
                      circumstances,
                      {Given(module, refusal, Facility::Account)}});
  }
  circumstances.rightPassword = false;
  trials.push_back({who + " with a wrong password", circumstances, {}});
  circumstances.directoryUp = false;
  for (Code failure : failures) {
    trials.push_back({who + ", while the directory's module answers " + NameOf(failure),
                      circumstances,
                      {Given(module, failure, Facility::Auth)}});
  }
  return trials;
}

std::vector<AnswerOverride> AnswersIn(const Policy& policy, const Trial& trial, const std::string& module) {
  std::vector<AnswerOverride> answers = trial.answers;
  std::vector<AnswerOverride> others = OtherWaysIn(policy, module);
  answers.insert(answers.end(), others.begin(), others.end());
  return answers;
}

LoginOutcome Play(const Policy& policy, const Trial& trial, const std::string& module, LoginExtent extent) {
  return SimulateLogin(policy, trial.circumstances, AnswersIn(policy, trial, module), extent);
}

std::vector<LoginCall> PlayEachCall(const Policy& policy, const Trial& trial, const std::string& module) {
  return SimulateEachCall(policy, trial.circumstances, AnswersIn(policy, trial, module));
}

/// How a call ends otherwise; empty when all end as before. Each call counts by itself: where one fails
/// anyway, the login as a whole would prove nothing about the others.
std::string ChangedCall(const Policy& without, const Policy& with, const Trial& trial,
                        const std::string& module) {
  std::vector<LoginCall> before = PlayEachCall(without, trial, module);
  std::vector<LoginCall> after = PlayEachCall(with, trial, module);
  auto [was, is] = std::mismatch(
      before.begin(), before.end(), after.begin(), after.end(),
      [](const LoginCall& one, const LoginCall& other) { return one.verdict.code == other.verdict.code; });
  if (was == before.end()) {
    return {};
  }
  std::string change = was->verdict.code == Code::Success  ? "it would shut out "
                       : is->verdict.code == Code::Success ? "it would let in "
                                                           : "it would refuse in another way ";
  return change + trial.login + " (" + is->reason + ", instead of " + NameOf(was->verdict.code) + ")";
}

/// Why nobody of the host itself gets in; empty when somebody does.
std::string ReasonForNobody(const Policy& policy, const std::string& module) {
  std::string reason;
  for (const Person& person : LocalPeople()) {
    LoginOutcome login =
        Play(policy, {"", CircumstancesOf(policy, person, module), {}}, module, LoginExtent::OwnSession);
    if (login.succeeds) {
      return {};
    }
    reason = reason.empty() ? login.reason : reason;
  }
  return reason;
}

}  // namespace

std::string UnsafeChange(const Policy& without, const Policy& with, const std::string& module) {
  for (const Trial& trial : LocalTrials(without, module)) {
    std::string change = ChangedCall(without, with, trial, module);
    if (!change.empty()) {
      return change;
    }
  }
  for (const Trial& trial : RefusedTrials(without, module)) {
    LoginOutcome after = Play(with, trial, module, LoginExtent::Admission);
    if (after.succeeds && !Play(without, trial, module, LoginExtent::Admission).succeeds) {
      return "it would let in " + trial.login + " (" + after.reason + ")";
    }
  }
  return {};
}

std::string ShutOut(const Policy& without, const Policy& with, const std::string& module) {
  // What the local users' module says of somebody whom the name service knows, or does not know.
  for (Code stranger :
       {Code::UserUnknown, Code::AuthenticationError, Code::AuthenticationInformationUnavailable}) {
    LoginOutcome login = Play(
        with,
        {"", CircumstancesOf(with, DirectoryUser(), module), {Given(localModule, stranger, Facility::Auth)}},
        module, LoginExtent::OwnSession);
    if (!login.succeeds) {
      std::string nobody = ReasonForNobody(without, module);
      return nobody.empty() ? "a user of the directory would still not get in (" + login.reason + ")"
                            : "it cannot be proved: no local user gets in as it is (" + nobody + ")";
    }
  }
  return {};
}

}  // namespace velmorctl::pam
