#include "pam/policy_line.h"

#include <algorithm>

namespace velmorctl::pam {

namespace {

constexpr std::string_view blanks = " \n\t";

struct Word {
  std::string text;
  bool bracketed = false;
};

/// Cuts words from the left of a line. A word that begins with "[" goes to the next "]" that no backslash
/// precedes, or to the line's end; what follows the "]" at once is a word of its own.
class Words {
 public:
  explicit Words(std::string_view line) : line_(line) {}

  std::optional<Word> Next() {
    std::size_t begin = line_.find_first_not_of(blanks);
    if (begin == std::string_view::npos) {
      line_ = {};
      return std::nullopt;
    }
    line_.remove_prefix(begin);
    return line_.front() == '[' ? Bracketed() : Plain();
  }

 private:
  void Drop(std::size_t count) { line_.remove_prefix(std::min(count, line_.size())); }

  Word Plain() {
    std::size_t end = std::min(line_.find_first_of(blanks), line_.size());
    Word word = {std::string(line_.substr(0, end)), false};
    Drop(end + 1);
    return word;
  }

  Word Bracketed() {
    Word word = {"", true};
    std::size_t position = 1;
    while (position < line_.size() && line_[position] != ']') {
      if (line_.substr(position).starts_with("\\]")) {
        ++position;
      }
      word.text += line_[position++];
    }
    Drop(position + 1);
    return word;
  }

  std::string_view line_;
};

using Effect = PolicyLine::Effect;

/// A later problem does not hide an earlier one, but the graver effect counts.
void Blame(PolicyLine& line, Effect effect, const std::string& problem, const std::string& value) {
  if (line.problem.empty()) {
    line.problem = problem;
    line.problemValue = value;
  }
  line.effect = std::max(line.effect, effect);
}

void ReadFacility(const Word& word, PolicyLine& line) {
  line.quiet = word.text.starts_with('-');
  line.facilityWord = word.text.substr(line.quiet ? 1 : 0);
  line.facility = FacilityOf(line.facilityWord);
  if (SameWord(line.facilityWord, "@include")) {
    line.kind = PolicyLine::Kind::IncludeWhole;
  } else if (!line.facility) {
    Blame(line, Effect::Fails, "it begins with none of auth, account, password, session and @include",
          line.facilityWord);
  }
}

void ReadControlWord(const std::optional<Word>& word, PolicyLine& line) {
  if (!word) {
    Blame(line, Effect::Fails, "it has no control and no module", line.facilityWord);
    return;
  }
  line.controlText = word->text;
  line.bracketed = word->bracketed;
  Control control = ReadControl(word->text);
  line.actions = control.actions;
  if (control.kind == Control::Kind::Include) {
    line.kind = PolicyLine::Kind::Include;
  } else if (control.kind == Control::Kind::Substack) {
    line.kind = PolicyLine::Kind::Substack;
  } else if (control.kind == Control::Kind::Invalid) {
    Blame(line, Effect::AlwaysBad, "the control cannot be understood: " + control.problem, line.controlText);
  }
}

/// libpam names a module by its file name up to the last dot, and refuses names that its log cannot show.
bool HasModuleName(std::string_view path) {
  std::string_view name = path.substr(path.rfind('/') + 1);
  name = name.substr(0, name.rfind('.'));
  return !name.empty() && name != "?";
}

void ReadTarget(const std::optional<Word>& word, PolicyLine& line) {
  bool module = line.kind == PolicyLine::Kind::Module;
  if (!word) {
    if (!module) {
      Blame(line, Effect::Crashes, "it does not say which file to include", line.controlText);
    } else {
      Blame(line, Effect::Fails, "it has no module", line.controlText);
    }
    return;
  }
  line.target = word->text;
  if (module && !HasModuleName(line.target)) {
    Blame(line, Effect::WholeFails, "this cannot name a module", line.target);
  }
}

bool NeedsBrackets(std::string_view argument) {
  return argument.empty() || argument.front() == '[' ||
         argument.find_first_of(blanks) != std::string_view::npos;
}

std::string InBrackets(std::string_view text) {
  std::string result = "[";
  for (char letter : text) {
    result += letter == ']' ? std::string("\\]") : std::string(1, letter);
  }
  return result + "]";
}

}  // namespace

std::string PolicyLine::Control() const {
  return bracketed ? InBrackets(controlText) : controlText;
}

PolicyLine ReadPolicyLine(std::string_view text) {
  PolicyLine line;
  Words words(text);
  ReadFacility(words.Next().value_or(Word()), line);
  if (line.kind != PolicyLine::Kind::IncludeWhole) {
    ReadControlWord(words.Next(), line);
  }
  ReadTarget(words.Next(), line);
  while (std::optional<Word> word = words.Next()) {
    line.arguments.push_back(word->text);
  }
  return line;
}

std::string QuotedArgument(std::string_view argument) {
  return NeedsBrackets(argument) ? InBrackets(argument) : std::string(argument);
}

}  // namespace velmorctl::pam
