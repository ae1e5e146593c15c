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

Person DirectoryUser() {
  return FindPerson("directory-user", {});
}

/// What a directory's module may answer when it cannot ask the directory, or is not there itself.
constexpr std::initializer_list<Code> failures = {Code::AuthenticationInformationUnavailable,
                                                  Code::ServiceError, Code::SystemError, Code::ModuleUnknown};

std::vector<Trial> LocalTrials(const Policy& policy, const std::string& module) {
  std::vector<Trial> trials;
  for (bool rightPassword : {true, false}) {
    Circumstances circumstances = CircumstancesOf(policy, LocalAdministrator(), module);
    circumstances.rightPassword = rightPassword;
    std::string who =
        std::string("a local user with ") + (rightPassword ? "the right" : "a wrong") + " password";
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

LoginOutcome Play(const Policy& policy, const Trial& trial, const std::string& module) {
  std::vector<AnswerOverride> answers = trial.answers;
  std::vector<AnswerOverride> others = OtherWaysIn(policy, module);
  answers.insert(answers.end(), others.begin(), others.end());
  return SimulateLogin(policy, trial.circumstances, answers);
}

bool ChangesPassword(const Policy& policy, const Circumstances& circumstances, const std::string& module) {
  Answers answers = [&](const StackEntry& entry, std::size_t, Operation operation) {
    return IsAnotherWayIn(entry, module) ? Code::UserUnknown : AnswerOf(entry, operation, circumstances).code;
  };
  FrozenChain chain;
  const Stack& stack = policy.StackOf(Facility::Password);
  return Simulate(stack, Operation::PrepareTokenChange, answers, chain).code == Code::Success &&
         Simulate(stack, Operation::ChangeToken, answers, chain).code == Code::Success;
}

}  // namespace

std::string UnsafeChange(const Policy& without, const Policy& with, const std::string& module) {
  for (const Trial& trial : LocalTrials(without, module)) {
    bool before = Play(without, trial, module).succeeds;
    LoginOutcome after = Play(with, trial, module);
    if (before != after.succeeds) {
      return (before ? "it would shut out " : "it would let in ") + trial.login + " (" + after.reason + ")";
    }
    if (ChangesPassword(without, trial.circumstances, module) !=
        ChangesPassword(with, trial.circumstances, module)) {
      return "changes of password would end differently for " + trial.login;
    }
  }
  for (const Trial& trial : RefusedTrials(without, module)) {
    LoginOutcome after = Play(with, trial, module);
    if (after.succeeds && !Play(without, trial, module).succeeds) {
      return "it would let in " + trial.login + " (" + after.reason + ")";
    }
  }
  return {};
}

std::string ShutOut(const Policy& without, const Policy& with, const std::string& module) {
  if (!Play(without, {"", CircumstancesOf(without, LocalAdministrator(), module), {}}, module).succeeds) {
    return {};
  }
  // What the local users' module says of somebody whom the name service knows, or does not know.
  for (Code stranger :
       {Code::UserUnknown, Code::AuthenticationError, Code::AuthenticationInformationUnavailable}) {
    LoginOutcome login = Play(
        with,
        {"", CircumstancesOf(with, DirectoryUser(), module), {Given(localModule, stranger, Facility::Auth)}},
        module);
    if (!login.succeeds) {
      return "a user of the directory would still not get in (" + login.reason + ")";
    }
  }
  return {};
}

}  // namespace velmorctl::pam
