#include "pam/check.h"

#include <algorithm>

#include "pam/login.h"
#include "pam/resolver.h"
#include "pam/stack_walk.h"

namespace velmorctl::pam {

namespace {

class ServiceCheck {
 public:
  ServiceCheck(const std::string& service, const CheckedSystem& system)
      : system_(system), policy_(ResolvePolicy(service, system.read)), findings_(policy_.findings) {}

  std::vector<Finding> Run() {
    if (policy_.state != Policy::State::Usable) {
      return std::move(findings_);
    }
    for (Facility facility : facilities) {
      if (policy_.HasOwn(facility)) {
        CheckModules(policy_.StackOf(facility));
        CheckReach(facility);
      }
    }
    if (IsLoginService(policy_, system_.directoryModules)) {
      CheckLocalLogin();
    }
    if (policy_.HasOwn(Facility::Auth)) {
      CheckWrongPassword();
    }
    return std::move(findings_);
  }

 private:
  void Report(Finding finding) {
    if (std::find(findings_.begin(), findings_.end(), finding) == findings_.end()) {
      findings_.push_back(std::move(finding));
    }
  }

  /// A line that says so may name a module that is not there, as long as that changes nothing.
  static bool MayBeMissing(const StackEntry& entry) {
    Action action = ActionFor(entry.actions, ReturnCode::ModuleUnknown);
    return entry.quiet && action.kind == Action::Kind::Ignore;
  }

  void CheckModules(const Stack& stack) {
    for (const StackEntry& entry : stack) {
      if (entry.kind == StackEntry::Kind::Module && !MayBeMissing(entry) &&
          !system_.moduleExists(entry.module)) {
        Report({entry.origin, entry.module, "the module does not exist",
                "install the package that brings it, or remove the line"});
      }
    }
  }

  /// A pam_deny that nothing leads to is left alone: it does no harm, and pam-auth-update writes such lines.
  void CheckReach(Facility facility) {
    const Stack& stack = policy_.StackOf(facility);
    std::vector<bool> reachable = ReachableEntries(stack);
    for (std::size_t index = 0; index < stack.size(); ++index) {
      if (!reachable[index] && ModuleName(stack[index].module) != "pam_deny") {
        Report({stack[index].origin, stack[index].module,
                "nothing in the " + std::string(NameOf(facility)) + " stack of \"" + policy_.service +
                    "\" ever leads to this line",
                "remove the line, or move it before the one that ends the stack"});
      }
    }
  }

  LoginOutcome Try(const Person& person, bool directoryUp, bool rightPassword) const {
    Circumstances circumstances;
    circumstances.user = person;
    circumstances.service = policy_.service;
    circumstances.directoryUp = directoryUp;
    circumstances.rightPassword = rightPassword;
    circumstances.directoryModules = system_.directoryModules;
    circumstances.moduleExists = system_.moduleExists;
    circumstances.fileExists = system_.fileExists;
    return SimulateLogin(policy_, circumstances, {}, LoginExtent::OwnSession);
  }

  void ReportLogin(const std::string& reason, const std::string& remedy) {
    Report({{policy_.file, 0}, policy_.service, reason, remedy});
  }

  /// A service that keeps one of the two out on purpose is no fault; one that depends on the directory is.
  void CheckLocalLogin() {
    bool anybody = false;
    std::string why;
    for (const Person& person : {LocalAdministrator(), Root()}) {
      LoginOutcome away = Try(person, false, true);
      bool withDirectory = Try(person, true, true).succeeds;
      if (!away.succeeds && withDirectory) {
        ReportLogin("while the directory is away, " + InWords(person) + " cannot log in: " + away.reason,
                    "let the line of the directory's module ignore authinfo_unavail");
      }
      anybody = anybody || away.succeeds || withDirectory;
      why = why.empty() ? away.reason : why;
    }
    if (!anybody) {
      ReportLogin("no local user can log in, whether the directory is there or not: " + why,
                  "let pam_unix.so decide about local users, and what follows it agree");
    }
  }

  void CheckWrongPassword() {
    for (const Person& person : {LocalAdministrator(), Root()}) {
      for (bool directoryUp : {true, false}) {
        LoginOutcome outcome = Try(person, directoryUp, false);
        if (outcome.succeeds) {
          ReportLogin("a wrong password, or none, lets everybody in: " + outcome.reason,
                      "put \"auth requisite pam_deny.so\" before the line that succeeds");
          return;
        }
      }
    }
  }

  static std::string InWords(const Person& person) {
    return person.uid == 0 ? "root" : "a local user with the right password";
  }

  const CheckedSystem& system_;
  Policy policy_;
  std::vector<Finding> findings_;
};

}  // namespace

bool IsLoginService(const Policy& policy, const std::set<std::string>& directoryModules) {
  const Stack& stack = policy.StackOf(Facility::Auth);
  bool asks = std::any_of(stack.begin(), stack.end(), [&directoryModules](const StackEntry& entry) {
    return entry.kind == StackEntry::Kind::Module && AsksForPassword(entry.module, directoryModules);
  });
  return asks && policy.service != otherService && policy.HasOwn(Facility::Auth) &&
         policy.HasOwn(Facility::Account);
}

std::vector<Finding> CheckService(const std::string& service, const CheckedSystem& system) {
  return ServiceCheck(service, system).Run();
}

}  // namespace velmorctl::pam
