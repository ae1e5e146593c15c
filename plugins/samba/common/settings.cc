#include "common/settings.h"

#include <charconv>
#include <set>

#include "common/files.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

std::string_view Trimmed(std::string_view text) {
  const size_t first = text.find_first_not_of(" \t\r");
  if (first == std::string_view::npos) return {};
  return text.substr(first, text.find_last_not_of(" \t\r") - first + 1);
}

std::string_view Unquoted(std::string_view text) {
  const bool quoted =
      text.size() >= 2 && text.front() == text.back() && (text.front() == '"' || text.front() == '\'');
  return quoted ? text.substr(1, text.size() - 2) : text;
}

class Parser {
 public:
  void Line(std::string_view line) {
    ++number_;
    if (Trimmed(line).empty()) return;
    const size_t delimiter = line.find('=');
    if (delimiter == std::string_view::npos) Refuse("has no \"=\"");
    const std::string key(Trimmed(line.substr(0, delimiter)));
    if (!seen_.insert(key).second) Refuse("sets '" + key + "' again");
    Set(key, Unquoted(Trimmed(line.substr(delimiter + 1))));
  }

  const Settings& Result() const { return settings_; }

 private:
  [[noreturn]] void Refuse(const std::string& fault) const {
    throw Failure(kHostConfigurationInTheWay,
                  std::string(paths::kSettings) + ": line " + std::to_string(number_) + " " + fault);
  }

  void Set(const std::string& key, std::string_view value) {
    if (key == "reuse-account") {
      if (value != "yes" && value != "no") Refuse("needs yes or no");
      settings_.reuseAccount = value == "yes";
    } else if (key == "winbind-request-timeout") {
      settings_.winbindRequestTimeout = Seconds(value, 2, 600);
    } else if (key == "operation-timeout") {
      settings_.operationTimeout = Seconds(value, 1, 3600);
    } else {
      Refuse("has the unknown key '" + key + "'");
    }
  }

  std::chrono::seconds Seconds(std::string_view value, int least, int most) const {
    int number = 0;
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), number);
    if (error != std::errc() || end != value.data() + value.size() || number < least || number > most) {
      Refuse("needs a number of seconds from " + std::to_string(least) + " to " + std::to_string(most));
    }
    return std::chrono::seconds(number);
  }

  int number_ = 0;
  std::set<std::string> seen_;
  Settings settings_;
};

}  // namespace

Settings ParseSettings(std::string_view text) {
  Parser parser;
  while (!text.empty()) {
    const size_t end = text.find('\n');
    parser.Line(text.substr(0, end));
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
  }
  return parser.Result();
}

Settings LoadSettings() {
  return ParseSettings(ReadFile(paths::kSettings).value_or(""));
}

}  // namespace sambaprovider
