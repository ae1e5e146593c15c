#include "hostmgmt/option_line.h"

#include <algorithm>
#include <charconv>
#include <cstddef>
#include <string_view>
#include <system_error>

namespace HostMgmt {
namespace {

constexpr std::string_view kBlanks = " \t\r\v\f";
constexpr std::string_view kNone = "none";

std::string_view TrimStart(std::string_view text) {
  return text.substr(std::min(text.find_first_not_of(kBlanks), text.size()));
}

std::string_view TrimEnd(std::string_view text) {
  return text.substr(0, text.find_last_not_of(kBlanks) + 1);
}

bool IsNameCharacter(char character) {
  return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
         (character >= '0' && character <= '9') || character == '-' || character == '_';
}

/// At least one branch name and the option's own name, none of them empty.
bool IsPath(std::string_view path) {
  if (path.find('.') == std::string_view::npos) return false;
  if (path.front() == '.' || path.back() == '.' || path.find("..") != std::string_view::npos) return false;
  return std::all_of(path.begin(), path.end(),
                     [](char character) { return character == '.' || IsNameCharacter(character); });
}

bool IsControlCharacter(char character) {
  const auto code = static_cast<unsigned char>(character);
  return (code < 0x20 && character != '\t') || code == 0x7f;
}

/// Takes text in double quotes off the start of `*rest`.
std::string TakeQuoted(std::string_view* rest) {
  std::string value;
  std::size_t position = 1;
  for (; position < rest->size() && (*rest)[position] != '"'; ++position) {
    if ((*rest)[position] == '\\') {
      ++position;
      const char escaped = position < rest->size() ? (*rest)[position] : '\0';
      if (escaped != '"' && escaped != '\\') {
        throw OptionLineError("a backslash must stand before a quote or a backslash");
      }
    }
    if (IsControlCharacter((*rest)[position])) throw OptionLineError("the text holds a control character");
    value += (*rest)[position];
  }
  if (position >= rest->size()) throw OptionLineError("the closing quote is missing");
  rest->remove_prefix(position + 1);
  return value;
}

/// Takes an integer or `none` off the start of `*rest`.
OptionValue TakeWord(std::string_view* rest) {
  const std::string_view word = rest->substr(0, rest->find_first_of(" \t\r\v\f#"));
  rest->remove_prefix(word.size());
  if (word == kNone) return NoOption{};
  std::int64_t value = 0;
  const auto [end, error] = std::from_chars(word.data(), word.data() + word.size(), value);
  if (error == std::errc::result_out_of_range) throw OptionLineError("the number is too large");
  if (error != std::errc() || end != word.data() + word.size()) {
    throw OptionLineError("the value is neither an integer nor text in double quotes");
  }
  return value;
}

OptionValue TakeValue(std::string_view* rest) {
  if (!rest->empty() && rest->front() == '"') return TakeQuoted(rest);
  return TakeWord(rest);
}

void RequirePath(std::string_view path) {
  if (!IsPath(path)) throw OptionLineError("'" + std::string(path) + "' is not the path of an option");
}

std::string FormatText(const std::string& text) {
  std::string quoted = "\"";
  for (const char character : text) {
    if (IsControlCharacter(character)) throw OptionLineError("the text holds a control character");
    if (character == '"' || character == '\\') quoted += '\\';
    quoted += character;
  }
  return quoted + '"';
}

std::string FormatValue(const OptionValue& value) {
  if (const auto* text = std::get_if<std::string>(&value)) return FormatText(*text);
  if (const auto* number = std::get_if<std::int64_t>(&value)) return std::to_string(*number);
  return std::string(kNone);
}

}  // namespace

std::optional<OptionLine> ParseOptionLine(const std::string& text) {
  std::string_view rest = TrimStart(text);
  if (rest.empty() || rest.front() == '#') return std::nullopt;
  const std::size_t equals = rest.find('=');
  if (equals == std::string_view::npos) throw OptionLineError("there is no '='");
  OptionLine line;
  line.path = TrimEnd(rest.substr(0, equals));
  RequirePath(line.path);
  rest = TrimStart(rest.substr(equals + 1));
  line.value = TakeValue(&rest);
  rest = TrimStart(rest);
  if (!rest.empty() && rest.front() != '#') throw OptionLineError("something follows the value");
  line.comment = rest;
  return line;
}

std::string FormatOptionLine(const OptionLine& line) {
  RequirePath(line.path);
  return line.path + " = " + FormatValue(line.value) + (line.comment.empty() ? "" : " " + line.comment);
}

}  // namespace HostMgmt
