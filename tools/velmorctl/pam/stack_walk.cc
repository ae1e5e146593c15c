#include "pam/stack_walk.h"

#include <array>

namespace velmorctl::pam {

namespace {

bool GoesOn(const Stack& stack, std::size_t index, std::size_t level) {
  return index + 1 < stack.size() && stack[index + 1].level >= level;
}

/// The actions that an entry can bring about.
std::vector<Action> PossibleActions(const StackEntry& entry) {
  if (entry.kind == StackEntry::Kind::Substack) {
    return {{Action::Kind::Ignore, 0}};
  }
  if (entry.kind == StackEntry::Kind::AlwaysFails) {
    return {ActionFor(entry.actions, ReturnCode::PermissionDenied)};
  }
  std::string module = ModuleName(entry.module);
  if (module == "pam_permit") {
    return {ActionFor(entry.actions, ReturnCode::Success)};
  }
  if (module == "pam_deny") {
    return {ActionFor(entry.actions, ReturnCode::AuthenticationError),
            ActionFor(entry.actions, ReturnCode::SessionError),
            ActionFor(entry.actions, ReturnCode::TokenError)};
  }
  return {entry.actions.begin(), entry.actions.end()};
}

/// Follows every way through a stack. Whether a module has refused counts, since "done" then ends nothing.
class Walk {
 public:
  explicit Walk(const Stack& stack) : stack_(stack), reached_(stack.size()) {}

  std::vector<bool> Run() {
    Reach(0, false);
    while (!open_.empty()) {
      Place place = open_.back();
      open_.pop_back();
      for (Action action : PossibleActions(stack_[place.index])) {
        Follow(place, action);
      }
    }
    std::vector<bool> reachable;
    for (const std::array<bool, 2>& reached : reached_) {
      reachable.push_back(reached[0] || reached[1]);
    }
    return reachable;
  }

 private:
  struct Place {
    std::size_t index;
    bool refused;
  };

  void Reach(std::size_t index, bool refused) {
    if (index < stack_.size() && !reached_[index][refused ? 1 : 0]) {
      reached_[index][refused ? 1 : 0] = true;
      open_.push_back({index, refused});
    }
  }

  void Follow(Place place, Action action) {
    switch (action.kind) {
      case Action::Kind::Ignore:
      case Action::Kind::Ok:
        Reach(place.index + 1, place.refused);
        break;
      case Action::Kind::Reset:
        Reach(place.index + 1, false);
        Reach(place.index + 1, place.refused);
        break;
      case Action::Kind::Bad:
        Reach(place.index + 1, true);
        break;
      case Action::Kind::Done:
        Reach((place.refused ? place.index : LastOfStack(stack_, place.index)) + 1, place.refused);
        break;
      case Action::Kind::Die:
        Reach(LastOfStack(stack_, place.index) + 1, true);
        break;
      case Action::Kind::Jump: {
        JumpTarget target = TargetOfJump(stack_, place.index, action.jump);
        Reach(target.last + 1, place.refused || !target.inStack);
        break;
      }
    }
  }

  const Stack& stack_;
  std::vector<std::array<bool, 2>> reached_;
  std::vector<Place> open_;
};

}  // namespace

std::size_t LastOfStack(const Stack& stack, std::size_t index) {
  std::size_t level = stack[index].level;
  while (GoesOn(stack, index, level)) {
    ++index;
  }
  return index;
}

JumpTarget TargetOfJump(const Stack& stack, std::size_t index, std::int32_t count) {
  std::size_t level = stack[index].level;
  while (count > 0 && GoesOn(stack, index, level)) {
    do {
      ++index;
    } while (GoesOn(stack, index, level + 1));
    --count;
  }
  return {index, count == 0};
}

std::vector<bool> ReachableEntries(const Stack& stack) {
  return Walk(stack).Run();
}

}  // namespace velmorctl::pam
