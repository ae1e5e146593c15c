#include "pam/succeed_if.h"

#include <fnmatch.h>

#include <algorithm>
#include <charconv>
#include <optional>
#include <sstream>

namespace velmorctl::pam {

namespace {

/// Held, not held, not decidable, or no test at all.
enum class Holds { Yes, No, Unknown, Senseless };

Holds AsHolds(bool holds) {
  return holds ? Holds::Yes : Holds::No;
}

bool IsFlag(const std::string& argument) {
  constexpr std::string_view flags[] = {"debug", "use_uid", "quiet", "quiet_fail", "quiet_success", "audit"};
  return std::find(std::begin(flags), std::end(flags), argument) != std::end(flags);
}

std::optional<std::int64_t> Number(const std::string& text) {
  std::int64_t number = 0;
  auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  bool whole = error == std::errc() && end == text.data() + text.size();
  return whole ? std::optional(number) : std::nullopt;
}

std::vector<std::string> ListOf(const std::string& text) {
  std::vector<std::string> items;
  std::istringstream stream(text);
  for (std::string item; std::getline(stream, item, ':');) {
    items.push_back(item);
  }
  return items;
}

Holds CompareNumbers(std::int64_t left, const std::string& operation, std::int64_t right) {
  struct Comparison {
    std::string_view word;
    std::string_view sign;
    bool holds;
  };
  const Comparison comparisons[] = {{"lt", "<", left < right},  {"le", "<=", left <= right},
                                    {"eq", "=", left == right}, {"ge", ">=", left >= right},
                                    {"gt", ">", left > right},  {"ne", "!=", left != right}};
  for (const Comparison& comparison : comparisons) {
    if (operation == comparison.word || operation == comparison.sign) {
      return AsHolds(comparison.holds);
    }
  }
  return Holds::Senseless;
}

Holds CompareTexts(const std::string& left, const std::string& operation, const std::string& right) {
  const std::vector<std::string> list = ListOf(right);
  bool listed = std::find(list.begin(), list.end(), left) != list.end();
  if (operation == "=" || operation == "!=") {
    return AsHolds((left == right) == (operation == "="));
  }
  if (operation == "=~" || operation == "!~") {
    return AsHolds((fnmatch(right.c_str(), left.c_str(), 0) == 0) == (operation == "=~"));
  }
  if (operation == "in" || operation == "notin") {
    return AsHolds(listed == (operation == "in"));
  }
  return Holds::Senseless;
}

/// The tests of one call of the module.
class Tests {
 public:
  Tests(const Person& person, const std::string& service, bool known, bool undecidedHolds)
      : person_(person), service_(service), known_(known), undecidedHolds_(undecidedHolds) {}

  ModuleAnswer Run(const std::vector<std::string>& words) {
    for (std::size_t index = 0; index < words.size(); index += 3) {
      if (index + 2 >= words.size()) {
        return {ReturnCode::ServiceError, "a test is incomplete"};
      }
      std::string test = words[index] + " " + words[index + 1] + " " + words[index + 2];
      Holds holds = Evaluate(words[index], words[index + 1], words[index + 2]);
      if (unknownUser_) {
        return {ReturnCode::UserUnknown, ""};
      }
      if (holds == Holds::Senseless) {
        return {ReturnCode::ServiceError, "\"" + test + "\" is no test"};
      }
      if (holds == Holds::No) {
        return {ReturnCode::AuthenticationError, "\"" + test + "\" does not hold"};
      }
      if (holds == Holds::Unknown && !undecidedHolds_) {
        return {ReturnCode::AuthenticationError, "assumed: \"" + test + "\" does not hold"};
      }
      if (holds == Holds::Unknown) {
        note_ = "assumed: \"" + test + "\" holds";
      }
    }
    return {ReturnCode::Success, note_};
  }

 private:
  bool Known() {
    unknownUser_ = !known_;
    return known_;
  }

  Holds Evaluate(const std::string& attribute, const std::string& operation, const std::string& value) {
    if (attribute == "user" && (operation == "ingroup" || operation == "notingroup")) {
      return Known() ? InGroup(value, operation == "ingroup") : Holds::No;
    }
    if (attribute == "user" && (operation == "innetgr" || operation == "notinnetgr")) {
      return Holds::Unknown;
    }
    if (attribute == "uid" || attribute == "gid") {
      std::optional<std::int64_t> number = Number(value);
      return !number   ? Holds::Senseless
             : Known() ? CompareNumbers(attribute == "uid" ? person_.uid : person_.gid, operation, *number)
                       : Holds::No;
    }
    if (attribute == "shell" || attribute == "home") {
      return Known() ? CompareTexts(attribute == "shell" ? person_.shell : person_.home, operation, value)
                     : Holds::No;
    }
    return EvaluateItem(attribute, operation, value);
  }

  Holds EvaluateItem(const std::string& attribute, const std::string& operation,
                     const std::string& value) const {
    if (attribute == "user" || attribute == "service") {
      return CompareTexts(attribute == "user" ? person_.name : service_, operation, value);
    }
    bool ofTheCall = attribute == "tty" || attribute == "rhost" || attribute == "ruser";
    return ofTheCall ? Holds::Unknown : Holds::Senseless;
  }

  Holds InGroup(const std::string& value, bool wanted) const {
    if (!person_.groups) {
      return Holds::Unknown;
    }
    const std::vector<std::string> list = ListOf(value);
    bool member = std::any_of(list.begin(), list.end(),
                              [this](const std::string& group) { return person_.groups->contains(group); });
    return AsHolds(member == wanted);
  }

  const Person& person_;
  const std::string& service_;
  bool known_;
  bool undecidedHolds_;
  bool unknownUser_ = false;
  std::string note_;
};

}  // namespace

ModuleAnswer SucceedIf(const std::vector<std::string>& arguments, const Person& person,
                       const std::string& service, bool known, bool undecidedHolds) {
  std::vector<std::string> words;
  std::remove_copy_if(arguments.begin(), arguments.end(), std::back_inserter(words), IsFlag);
  return Tests(person, service, known, undecidedHolds).Run(words);
}

}  // namespace velmorctl::pam
