#include "nss/criterion.h"

#include <algorithm>
#include <utility>

#include "nss/words.h"

namespace velmorctl {

namespace {

constexpr std::pair<std::string_view, LookupStatus> statuses[] = {{"success", LookupStatus::Success},
                                                                  {"notfound", LookupStatus::NotFound},
                                                                  {"unavail", LookupStatus::Unavailable},
                                                                  {"tryagain", LookupStatus::TryAgain}};

constexpr std::pair<std::string_view, LookupAction> actions[] = {
    {"return", LookupAction::Return}, {"continue", LookupAction::Continue}, {"merge", LookupAction::Merge}};

char LowerCase(char character) {
  return character >= 'A' && character <= 'Z' ? static_cast<char>(character - 'A' + 'a') : character;
}

/// The value of a word in one of the tables; the case of letters does not count.
template <class Table>
auto Find(const Table& table, std::string_view word) {
  const auto* found = std::find_if(std::begin(table), std::end(table), [word](const auto& row) {
    return std::equal(row.first.begin(), row.first.end(), word.begin(), word.end(),
                      [](char left, char right) { return left == LowerCase(right); });
  });
  return found == std::end(table) ? std::nullopt : std::optional(found->second);
}

std::string_view WithoutLeadingSpace(std::string_view text) {
  while (!text.empty() && IsSpace(text.front())) {
    text.remove_prefix(1);
  }
  return text;
}

/// Takes the word in front of a blank or "=".
std::string_view TakeWord(std::string_view& text) {
  const auto* end =
      std::find_if(text.begin(), text.end(), [](char letter) { return IsSpace(letter) || letter == '='; });
  const std::string_view word = text.substr(0, static_cast<std::size_t>(end - text.begin()));
  text.remove_prefix(word.size());
  text = WithoutLeadingSpace(text);
  return word;
}

/// With a "!" every other status gets the action.
void Apply(LookupStatus status, bool negated, LookupAction action, Actions& result) {
  for (const auto& [word, other] : statuses) {
    if ((other == status) != negated) {
      result.Set(other, action);
    }
  }
}

}  // namespace

bool Actions::AlwaysReturn() const {
  return std::all_of(actions_.begin(), actions_.end(),
                     [](LookupAction action) { return action == LookupAction::Return; });
}

std::optional<Actions> ParseCriterion(std::string_view text) {
  Actions result;
  text = WithoutLeadingSpace(text);
  do {
    const bool negated = text.starts_with('!');
    text.remove_prefix(negated ? 1 : 0);
    const auto status = Find(statuses, TakeWord(text));
    if (!status || !text.starts_with('=')) {
      return std::nullopt;
    }
    text = WithoutLeadingSpace(text.substr(1));
    const auto action = Find(actions, TakeWord(text));
    if (!action) {
      return std::nullopt;
    }
    Apply(*status, negated, *action, result);
  } while (!text.empty());
  return result;
}

}  // namespace velmorctl
