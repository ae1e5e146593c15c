#include "pam/simulator.h"

#include <array>

#include "pam/stack_walk.h"

namespace velmorctl::pam {

namespace {

/// What libpam answers when a stack says neither yes nor no.
constexpr ReturnCode mustFail = ReturnCode::PermissionDenied;

enum class Impression { Undefined, Positive, Negative };

struct State {
  Impression impression = Impression::Undefined;
  ReturnCode status = mustFail;

  bool operator==(const State&) const = default;
};

bool GoesByFrozenChain(Operation operation) {
  return operation == Operation::SetCredentials || operation == Operation::CloseSession;
}

/// One run through a stack.
class Dispatch {
 public:
  Dispatch(const Stack& stack, Operation operation, const Answers& answers, FrozenChain& chain)
      : stack_(stack),
        operation_(operation),
        answers_(answers),
        chain_(chain),
        frozen_(GoesByFrozenChain(operation)) {
    chain_.resize(stack.size());
  }

  Verdict Run() {
    std::size_t previousLevel = 0;
    for (position_ = 0; position_ < stack_.size(); ++position_) {
      const StackEntry& entry = stack_[position_];
      level_ = entry.level;
      if (level_ > previousLevel) {
        Outer(level_) = state_;
      }
      previousLevel = level_;
      ReturnCode answer = AnswerOf(entry);
      if (answer == ReturnCode::Incomplete) {
        verdict_.code = answer;
        return verdict_;
      }
      Judge(answer);
    }
    bool refused = state_.status == ReturnCode::Success && state_.impression != Impression::Positive;
    verdict_.code = refused ? mustFail : state_.status;
    return verdict_;
  }

 private:
  /// The state before the substack of the level.
  State& Outer(std::size_t level) {
    if (outer_.size() <= level) {
      outer_.resize(level + 1);
    }
    return outer_[level];
  }

  ReturnCode AnswerOf(const StackEntry& entry) const {
    switch (entry.kind) {
      case StackEntry::Kind::Module:
        return answers_(entry, position_, operation_);
      case StackEntry::Kind::Substack:
        return ReturnCode::Ignore;
      case StackEntry::Kind::AlwaysFails:
        break;
    }
    return mustFail;
  }

  void Judge(ReturnCode answer) {
    std::optional<ReturnCode>& cached = chain_[position_];
    if (!frozen_ || !cached) {
      cached = answer;
    }
    Step step;
    step.entry = position_;
    step.answer = answer;
    step.frozen = *cached != answer;
    const StackEntry& entry = stack_[position_];
    if (entry.kind == StackEntry::Kind::Substack) {
      step.action = {Action::Kind::Ignore, 0};
    } else {
      step.action = IsKnown(answer) ? ActionFor(entry.actions, *cached) : Action();
    }
    State before = state_;
    step.badJump = !Apply(step.action, IsKnown(answer) ? answer : mustFail, *cached);
    step.decided = state_ != before;
    step.verdict = state_.status;
    verdict_.trace.push_back(step);
  }

  /// False when the action is a jump that leads out of the stack.
  bool Apply(Action action, ReturnCode answer, ReturnCode cached) {
    switch (action.kind) {
      case Action::Kind::Ignore:
        break;
      case Action::Kind::Reset:
        state_ = Outer(level_);
        break;
      case Action::Kind::Ok:
        Agree(answer, cached);
        break;
      case Action::Kind::Done:
        Agree(answer, cached);
        if (state_.impression == Impression::Positive) {
          LeaveStack();
        }
        break;
      case Action::Kind::Bad:
        Refuse(answer);
        break;
      case Action::Kind::Die:
        Refuse(answer);
        LeaveStack();
        break;
      case Action::Kind::Jump:
        return Jump(action.jump);
    }
    return true;
  }

  bool IsOpen() const {
    return state_.impression == Impression::Undefined ||
           (state_.impression == Impression::Positive && state_.status == ReturnCode::Success);
  }

  void Agree(ReturnCode answer, ReturnCode cached) {
    if (IsOpen() && (answer != ReturnCode::Ignore || cached == answer)) {
      state_ = {Impression::Positive, answer};
    }
  }

  void Refuse(ReturnCode answer) {
    if (state_.impression != Impression::Negative) {
      state_ = {Impression::Negative, answer == ReturnCode::Ignore ? mustFail : answer};
    }
  }

  void LeaveStack() { position_ = LastOfStack(stack_, position_); }

  bool Jump(std::int32_t count) {
    JumpTarget target = TargetOfJump(stack_, position_, count);
    position_ = target.last;
    if (!target.inStack) {
      state_ = {Impression::Negative, mustFail};
    }
    return target.inStack;
  }

  const Stack& stack_;
  Operation operation_;
  const Answers& answers_;
  FrozenChain& chain_;
  bool frozen_;
  std::size_t position_ = 0;
  std::size_t level_ = 0;
  State state_;
  std::vector<State> outer_ = {State()};
  Verdict verdict_;
};

}  // namespace

std::string_view NameOf(Operation operation) {
  constexpr std::array<std::string_view, 7> names = {"pam_authenticate", "pam_setcred",       "pam_acct_mgmt",
                                                     "pam_open_session", "pam_close_session", "pam_chauthtok",
                                                     "pam_chauthtok"};
  return names[static_cast<std::size_t>(operation)];
}

Facility FacilityFor(Operation operation) {
  constexpr std::array<Facility, 7> stacks = {Facility::Auth,    Facility::Auth,    Facility::Account,
                                              Facility::Session, Facility::Session, Facility::Password,
                                              Facility::Password};
  return stacks[static_cast<std::size_t>(operation)];
}

Verdict Simulate(const Stack& stack, Operation operation, const Answers& answers, FrozenChain& chain) {
  return Dispatch(stack, operation, answers, chain).Run();
}

}  // namespace velmorctl::pam
