#include "text.h"

#include <system_error>

namespace velmorctl {

std::string Printable(std::string_view text) {
  std::string result;
  for (std::size_t index = 0; index < text.size();) {
    const std::size_t size = ControlCharacterAt(text, index);
    result += size > 0 ? '?' : text[index];
    index += size > 0 ? size : 1;
  }
  return result;
}

std::size_t ControlCharacterAt(std::string_view text, std::size_t index) {
  const auto byte = static_cast<unsigned char>(text[index]);
  const auto next = index + 1 < text.size() ? static_cast<unsigned char>(text[index + 1]) : 0;
  if (byte == 0xc2 && next >= 0x80 && next <= 0x9f) {
    return 2;
  }
  return byte < 0x20 || byte == 0x7f ? 1 : 0;
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
