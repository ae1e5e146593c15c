#include "pam_line_reader.h"

#include <cstddef>
#include <list>
#include <optional>
#include <utility>

#include "pam_keywords.h"

namespace SystemConfiguration {
namespace {

bool IsWhiteSpace(char character) {
  return character == ' ' || (character >= '\t' && character <= '\r');
}

}  // namespace

// Walks a line by its line end, which makes looking for the end of the text needless.
class PAMLineReader::Words {
 public:
  explicit Words(std::string_view line) : next_(line.data()) {}

  // Empty at the line end.
  std::string_view Next() {
    while (IsWhiteSpace(*next_) && *next_ != '\n') ++next_;
    const char* const begin = next_;
    while (!IsWhiteSpace(*next_)) ++next_;
    return std::string_view(begin, static_cast<std::size_t>(next_ - begin));
  }

 private:
  const char* next_;
};

bool PAMLineReader::Append(std::string_view line) {
  if (line.empty()) return false;
  Words words(line);
  const auto facility = FindValue(facilityKeywords, words.Next());
  if (!facility) return false;
  const PAMControl::Control control = TakeControl(words);
  const std::string_view module = words.Next();
  if (control == PAMControl::Unset || module.empty()) return false;

  std::list<std::string> parameters;
  for (std::string_view word = words.Next(); !word.empty(); word = words.Next()) {
    parameters.emplace_back(word);
  }
  PAMStack& stack = StackOf(*facility);
  if (control == PAMControl::Bracketed) {
    stack.emplace_back(PAMControl(control, bracketed_), std::string(module));
  } else {
    stack.emplace_back(control, std::string(module));
  }
  stack.back().parameters() = std::move(parameters);
  return true;
}

// Unset when there is none.
PAMControl::Control PAMLineReader::TakeControl(Words& words) {
  const std::string_view word = words.Next();
  if (word.empty() || word.front() != '[')
    return FindValue(controlKeywords, word).value_or(PAMControl::Unset);
  bracketed_ = word;
  return TakeToClosingBracket(words) ? PAMControl::Bracketed : PAMControl::Unset;
}

bool PAMLineReader::TakeToClosingBracket(Words& words) {
  while (bracketed_.back() != ']') {
    const std::string_view word = words.Next();
    if (word.empty()) return false;
    bracketed_.append(1, ' ').append(word);
  }
  return true;
}

PAMStack& PAMLineReader::StackOf(PAMFacility::Facility facility) {
  PAMStack*& stack = stacks_[facility];
  if (stack == nullptr) stack = &policy_[facility];
  return *stack;
}

}  // namespace SystemConfiguration
