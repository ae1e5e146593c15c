#include "text.h"

#include <system_error>

namespace velmorctl {

std::string Printable(std::string_view text) {
  std::string result(text);
  for (char& character : result) {
    auto value = static_cast<unsigned char>(character);
    if (value < 0x20 || value == 0x7f) {
      character = '?';
    }
  }
  return result;
}

std::string SystemErrorText(int errorNumber) {
  return std::generic_category().message(errorNumber);
}

std::string Join(const std::vector<std::string>& parts, std::string_view separator) {
  std::string result;
  for (const std::string& part : parts) {
    if (!result.empty()) {
      result += separator;
    }
    result += part;
  }
  return result;
}

std::string_view Trimmed(std::string_view text) {
  std::size_t first = text.find_first_not_of(" \t");
  if (first == std::string_view::npos) {
    return {};
  }
  return text.substr(first, text.find_last_not_of(" \t") - first + 1);
}

}  // namespace velmorctl
