#include "pam/login.h"

#include <algorithm>
#include <array>
#include <charconv>

namespace velmorctl::pam {

namespace {

bool Matches(const AnswerOverride& override, const Stack& stack, std::size_t index, Operation operation) {
  if (ModuleName(stack[index].module) != override.module ||
      (override.facility && *override.facility != FacilityFor(operation))) {
    return false;
  }
  auto end = stack.begin() + static_cast<std::ptrdiff_t>(index + 1);
  auto occurrence = std::count_if(stack.begin(), end, [&override](const StackEntry& entry) {
    return entry.kind == StackEntry::Kind::Module && ModuleName(entry.module) == override.module;
  });
  return override.occurrence == 0 || static_cast<std::size_t>(occurrence) == override.occurrence;
}

std::string InWords(const StackEntry& entry, const Step& step) {
  std::string where = entry.origin.file + ":" + std::to_string(entry.origin.line);
  if (entry.kind == StackEntry::Kind::AlwaysFails) {
    return "the line " + where + " always fails";
  }
  std::string words = ModuleName(entry.module) + " (" + where + ") answered " + NameOf(step.answer);
  return step.badJump ? words + ", and the jump leads out of the stack" : words;
}

/// pam_permit and pam_deny only carry out what those before them have led to.
bool SpeaksForOthers(const StackEntry& entry) {
  std::string module = ModuleName(entry.module);
  return module == "pam_permit" || module == "pam_deny";
}

/// What the modules before a step have answered.
std::string AnswersBefore(const std::vector<Step>& trace, const Step& decisive, const Stack& stack) {
  std::string answers;
  for (const Step& step : trace) {
    if (step.entry < decisive.entry && stack[step.entry].kind == StackEntry::Kind::Module) {
      answers += answers.empty() ? ", after " : ", ";
      answers += ModuleName(stack[step.entry].module) + " " + NameOf(step.answer);
    }
  }
  return answers;
}

/// What made the verdict of a call what it is.
std::string ReasonOf(const LoginCall& call, const Stack& stack) {
  std::string result = std::string(NameOf(call.operation)) + " answers " + NameOf(call.verdict.code) + ": ";
  if (stack.empty()) {
    return result + "no line is for it";
  }
  const std::vector<Step>& trace = call.verdict.trace;
  auto decisive = std::find_if(trace.rbegin(), trace.rend(), [](const Step& step) { return step.decided; });
  if (decisive == trace.rend()) {
    return result + "no module said yes or no";
  }
  const StackEntry& entry = stack[decisive->entry];
  result += InWords(entry, *decisive);
  return SpeaksForOthers(entry) ? result + AnswersBefore(trace, *decisive, stack) : result;
}

class Login {
 public:
  Login(const Policy& policy, const Circumstances& circumstances,
        const std::vector<AnswerOverride>& overrides)
      : policy_(policy), circumstances_(circumstances), overrides_(overrides) {}

  LoginOutcome Run(LoginExtent extent) {
    LoginOutcome outcome;
    if (policy_.state != Policy::State::Usable) {
      outcome.reason = WhyUnusable(policy_);
      return outcome;
    }
    outcome.succeeds = Passes(Operation::Authenticate) && PassesAccount() &&
                       (extent == LoginExtent::Admission || PassesEntry(extent));
    // Of a login that succeeds, what authenticated tells most.
    outcome.reason = outcome.succeeds ? calls_.front().reason : calls_.back().reason;
    outcome.calls = std::move(calls_);
    return outcome;
  }

  std::vector<LoginCall> RunEach() {
    if (Passes(Operation::Authenticate)) {
      Call(Operation::SetCredentials);
    }
    Call(Operation::ManageAccount);
    ChangesPassword();
    if (Passes(Operation::OpenSession)) {
      Call(Operation::CloseSession);
    }
    ChainOf(Facility::Auth).clear();
    Call(Operation::SetCredentials);
    return std::move(calls_);
  }

 private:
  FrozenChain& ChainOf(Facility facility) { return chains_[static_cast<std::size_t>(facility)]; }

  ModuleAnswer Answer(const Stack& stack, std::size_t index, Operation operation) const {
    for (const AnswerOverride& override : overrides_) {
      if (Matches(override, stack, index, operation)) {
        return {override.answer, "as given"};
      }
    }
    return AnswerOf(stack[index], operation, circumstances_);
  }

  bool Passes(Operation operation) { return Call(operation) == ReturnCode::Success; }

  bool ChangesPassword() { return Passes(Operation::PrepareTokenChange) && Passes(Operation::ChangeToken); }

  bool PassesAccount() {
    ReturnCode code = Call(Operation::ManageAccount);
    return code == ReturnCode::NewTokenRequired ? ChangesPassword() : code == ReturnCode::Success;
  }

  bool PassesEntry(LoginExtent extent) {
    bool opensSession = extent == LoginExtent::Whole || policy_.HasOwn(Facility::Session);
    return Passes(Operation::SetCredentials) && (!opensSession || Passes(Operation::OpenSession));
  }

  ReturnCode Call(Operation operation) {
    Facility facility = FacilityFor(operation);
    const Stack& stack = policy_.StackOf(facility);
    LoginCall call;
    call.operation = operation;
    std::vector<std::string> notes(stack.size());
    Answers answers = [&](const StackEntry&, std::size_t index, Operation) {
      ModuleAnswer answer = Answer(stack, index, operation);
      notes[index] = std::move(answer.note);
      return answer.code;
    };
    call.verdict = Simulate(stack, operation, answers, ChainOf(facility));
    for (const Step& step : call.verdict.trace) {
      call.notes.push_back(notes[step.entry]);
    }
    call.reason = ReasonOf(call, stack);
    calls_.push_back(std::move(call));
    return calls_.back().verdict.code;
  }

  const Policy& policy_;
  const Circumstances& circumstances_;
  const std::vector<AnswerOverride>& overrides_;
  std::array<FrozenChain, facilities.size()> chains_;
  std::vector<LoginCall> calls_;
};

}  // namespace

std::optional<AnswerOverride> ReadAnswerOverride(const std::string& text) {
  AnswerOverride override;
  std::size_t equals = text.rfind('=');
  std::optional<ReturnCode> answer =
      equals == std::string::npos ? std::nullopt : ReturnCodeOf(text.substr(equals + 1));
  std::string module = text.substr(0, equals);
  if (std::size_t colon = module.find(':'); colon != std::string::npos) {
    override.facility = FacilityOf(module.substr(0, colon));
    if (!override.facility) {
      return std::nullopt;
    }
    module.erase(0, colon + 1);
  }
  if (std::size_t number = module.find('#'); number != std::string::npos) {
    const char* end = module.data() + module.size();
    auto [stop, error] = std::from_chars(module.data() + number + 1, end, override.occurrence);
    if (error != std::errc() || stop != end || override.occurrence == 0) {
      return std::nullopt;
    }
    module.resize(number);
  }
  override.module = ModuleName(module);
  if (!answer || override.module.empty()) {
    return std::nullopt;
  }
  override.answer = *answer;
  return override;
}

LoginOutcome SimulateLogin(const Policy& policy, const Circumstances& circumstances,
                           const std::vector<AnswerOverride>& overrides, LoginExtent extent) {
  return Login(policy, circumstances, overrides).Run(extent);
}

std::vector<LoginCall> SimulateEachCall(const Policy& policy, const Circumstances& circumstances,
                                        const std::vector<AnswerOverride>& overrides) {
  return Login(policy, circumstances, overrides).RunEach();
}

std::string WhyUnusable(const Policy& policy) {
  std::string what = policy.state == Policy::State::Fatal ? "libpam crashes or hangs"
                                                          : "libpam refuses the service with abort";
  if (policy.findings.empty()) {
    return what;
  }
  const Finding& last = policy.findings.back();
  return what + ": " + last.origin.file +
         (last.origin.line > 0 ? ":" + std::to_string(last.origin.line) : "") + ": " + last.reason;
}

}  // namespace velmorctl::pam
