#include "pam/control.h"

#include <limits>
#include <optional>
#include <utility>

#include "pam/facility.h"

namespace velmorctl::pam {

namespace {

using Kind = Action::Kind;

constexpr std::pair<std::string_view, Kind> actionNames[] = {
    {"ignore", Kind::Ignore}, {"ok", Kind::Ok},   {"done", Kind::Done},
    {"bad", Kind::Bad},       {"die", Kind::Die}, {"reset", Kind::Reset}};

constexpr std::string_view defaultValue = "default";

Actions KeywordActions(Kind success, Kind ignore, Kind others) {
  Actions actions;
  actions.fill({others, 0});
  actions[static_cast<std::size_t>(ReturnCode::Success)] = {success, 0};
  actions[static_cast<std::size_t>(ReturnCode::NewTokenRequired)] = {success, 0};
  actions[static_cast<std::size_t>(ReturnCode::Ignore)] = {ignore, 0};
  return actions;
}

struct Keyword {
  std::string_view word;
  Control::Kind kind;
  Kind success;
  Kind others;
};

constexpr Keyword keywords[] = {{"required", Control::Kind::Keyword, Kind::Ok, Kind::Bad},
                                {"requisite", Control::Kind::Keyword, Kind::Ok, Kind::Die},
                                {"sufficient", Control::Kind::Keyword, Kind::Done, Kind::Ignore},
                                {"optional", Control::Kind::Keyword, Kind::Ok, Kind::Ignore},
                                {"include", Control::Kind::Include, Kind::Bad, Kind::Bad},
                                {"substack", Control::Kind::Substack, Kind::Bad, Kind::Bad}};

/// Reads value=action pairs from the left of a text.
class ListReader {
 public:
  explicit ListReader(std::string_view text) : text_(text) {}

  Control Read() {
    Control control = {Control::Kind::Bracketed, {}, ""};
    for (SkipBlanks(); !text_.empty() && control.problem.empty(); SkipBlanks()) {
      control.problem = ReadPair();
    }
    if (!control.problem.empty()) {
      control.kind = Control::Kind::Invalid;
      return control;
    }
    for (std::size_t index = 0; index < actions_.size(); ++index) {
      control.actions[index] = actions_[index].value_or(Action());
    }
    return control;
  }

 private:
  void SkipBlanks() {
    while (!text_.empty() && std::string_view(" \n\t\v\f\r").find(text_.front()) != std::string_view::npos) {
      text_.remove_prefix(1);
    }
  }

  bool Take(std::string_view word) {
    if (!text_.starts_with(word)) {
      return false;
    }
    text_.remove_prefix(word.size());
    return true;
  }

  std::string Rest() const { return "\"" + std::string(text_) + "\""; }

  std::string ReadPair() {
    std::optional<std::size_t> value = TakeValue();
    if (!value) {
      return "no return value has a name with which " + Rest() + " begins";
    }
    SkipBlanks();
    if (!Take("=")) {
      return "\"=\" is missing before " + Rest();
    }
    SkipBlanks();
    std::optional<Action> action = TakeAction();
    if (!action) {
      return Rest() + " begins with no action and no number of modules to pass over";
    }
    Set(*value, *action);
    return "";
  }

  /// The number of the value; returnCodeCount for "default".
  std::optional<std::size_t> TakeValue() {
    for (std::size_t number = 0; number < returnCodeCount; ++number) {
      if (Take(NameOf(static_cast<ReturnCode>(number)))) {
        return number;
      }
    }
    return Take(defaultValue) ? std::optional(returnCodeCount) : std::nullopt;
  }

  std::optional<Action> TakeAction() {
    for (const auto& [name, kind] : actionNames) {
      if (Take(name)) {
        return Action{kind, 0};
      }
    }
    return TakeJump();
  }

  std::optional<Action> TakeJump() {
    std::int64_t jump = 0;
    while (!text_.empty() && text_.front() >= '0' && text_.front() <= '9') {
      jump = jump * 10 + (text_.front() - '0');
      if (jump > std::numeric_limits<std::int32_t>::max()) {
        return std::nullopt;
      }
      text_.remove_prefix(1);
    }
    return jump > 0 ? std::optional(Action{Kind::Jump, static_cast<std::int32_t>(jump)}) : std::nullopt;
  }

  /// "default" is for the values that have no action so far; a later pair still gives one another action.
  void Set(std::size_t value, Action action) {
    if (value < actions_.size()) {
      actions_[value] = action;
      return;
    }
    for (std::optional<Action>& unset : actions_) {
      unset = unset.value_or(action);
    }
  }

  std::string_view text_;
  std::array<std::optional<Action>, returnCodeCount> actions_;
};

}  // namespace

std::string NameOf(Action action) {
  for (const auto& [name, kind] : actionNames) {
    if (kind == action.kind) {
      return std::string(name);
    }
  }
  return std::to_string(action.jump);
}

Action ActionFor(const Actions& actions, ReturnCode answer) {
  return IsKnown(answer) ? actions[static_cast<std::size_t>(answer)] : Action();
}

Control ReadControl(std::string_view text) {
  for (const Keyword& keyword : keywords) {
    if (SameWord(keyword.word, text)) {
      bool file = keyword.kind != Control::Kind::Keyword;
      return {keyword.kind, KeywordActions(keyword.success, file ? Kind::Bad : Kind::Ignore, keyword.others),
              ""};
    }
  }
  return ListReader(text).Read();
}

}  // namespace velmorctl::pam
