#ifndef SYSTEMCONFIGURATION_KEYWORD_TABLE_H
#define SYSTEMCONFIGURATION_KEYWORD_TABLE_H

#include <array>
#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace SystemConfiguration {

template <typename Value>
struct Keyword {
  Value value;
  std::string_view text;
};

/// The keywords of one enumeration. The one table serves both directions and is a constant of the program: it
/// needs no initialisation when the library is loaded.
template <typename Value, std::size_t count>
using KeywordTable = std::array<Keyword<Value>, count>;

template <typename Value, std::size_t count>
constexpr std::optional<Value> FindValue(const KeywordTable<Value, count>& table, std::string_view text) {
  for (const Keyword<Value>& keyword : table) {
    if (keyword.text == text) return keyword.value;
  }
  return std::nullopt;
}

template <typename Value, std::size_t count>
constexpr std::optional<std::string_view> FindText(const KeywordTable<Value, count>& table, Value value) {
  for (const Keyword<Value>& keyword : table) {
    if (keyword.value == value) return keyword.text;
  }
  return std::nullopt;
}

/// The message for a value without a keyword: the prefix less as many leading characters as the value says,
/// and nothing once the prefix is used up.
inline std::string MessageWithoutKeyword(std::string_view prefix, std::size_t value) {
  return value < prefix.size() ? std::string(prefix.substr(value)) : std::string();
}

/// The message for a word that no table holds.
inline std::string MessageForUnknown(std::string_view prefix, std::string_view word) {
  return std::string(prefix).append(word);
}

}  // namespace SystemConfiguration

#endif
