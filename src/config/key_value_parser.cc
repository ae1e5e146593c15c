#include "config/key_value_parser.h"

#include "authentication/library_exceptions.h"
#include "errors/string_cast.h"

namespace quenix::authentication {

namespace {

bool IsQuote(char character) {
  return character == '"' || character == '\'';
}

std::string Clean(const std::string& part, int lineNumber) {
  const auto first = part.find_first_not_of(blanks);
  if (first == std::string::npos) return part;  // Deliberate: a part of blanks only keeps them.
  const auto last = part.find_last_not_of(blanks);
  const bool quoted = IsQuote(part[first]) && part[first] == part[last];
  if (quoted && first == last) {
    throw ConfigurationError("Error parsing configuration at line " + string_cast<int>(lineNumber) +
                             ": invalid quoting");
  }
  return quoted ? part.substr(first + 1, last - first - 1) : part.substr(first, last - first + 1);
}

}  // namespace

std::pair<std::string, std::string> GetKeyValuePair(const std::string& line, int lineNumber) {
  const auto delimiter = line.find('=');
  if (delimiter == std::string::npos) {
    throw ConfigurationError("Error parsing configuration on line " + string_cast<int>(lineNumber) +
                             ": no delimiter found");
  }
  // The value first: of two malformed parts, the error names the value's fault.
  std::string value = Clean(line.substr(delimiter + 1), lineNumber);
  std::string key = Clean(line.substr(0, delimiter), lineNumber);
  return {std::move(key), std::move(value)};
}

}  // namespace quenix::authentication
