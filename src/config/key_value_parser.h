/// One line of a key-value file.
#ifndef CONFIG_KEY_VALUE_PARSER_H
#define CONFIG_KEY_VALUE_PARSER_H

#include <string>
#include <string_view>
#include <utility>

namespace quenix::authentication {

/// What surrounds keys and values without belonging to them.
inline constexpr std::string_view blanks = " \t";

/// Splits `line` at its first "=" and cleans both parts. Throws ConfigurationError, which names `lineNumber`,
/// when there is no "=" or when a part is one quote alone.
std::pair<std::string, std::string> GetKeyValuePair(const std::string& line, int lineNumber);

}  // namespace quenix::authentication

#endif  // CONFIG_KEY_VALUE_PARSER_H
