#include "service/host_name.h"

#include <fnmatch.h>

#include <algorithm>

namespace camd {
namespace {

constexpr size_t kLongestHostName = 253;
constexpr size_t kLongestLabel = 63;
constexpr size_t kLongestComputerName = 15;

bool IsDigit(char byte) {
  return byte >= '0' && byte <= '9';
}
bool IsLetter(char byte) {
  return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
}

bool IsLabel(std::string_view label) {
  return !label.empty() && label.size() <= kLongestLabel && label.front() != '-' && label.back() != '-' &&
         std::all_of(label.begin(), label.end(),
                     [](char byte) { return IsDigit(byte) || IsLetter(byte) || byte == '-'; });
}

std::string_view FirstLabel(std::string_view name) {
  return name.substr(0, name.find('.'));
}

}  // namespace

bool IsHostName(std::string_view name) {
  if (name.size() > kLongestHostName) return false;
  for (;;) {
    const size_t dot = name.find('.');
    if (!IsLabel(name.substr(0, dot))) return false;
    if (dot == std::string_view::npos) return true;
    name.remove_prefix(dot + 1);
  }
}

std::string ComputerNameOf(std::string_view hostName) {
  std::string name(FirstLabel(hostName));
  if (!IsLabel(name) || name.size() > kLongestComputerName) return "";
  if (std::all_of(name.begin(), name.end(), IsDigit)) return "";
  for (char& byte : name) byte = static_cast<char>(byte >= 'a' && byte <= 'z' ? byte - 32 : byte);
  return name;
}

bool FitsAnyPattern(std::string_view hostName, const std::vector<std::string>& patterns) {
  const std::string whole(hostName);
  const std::string first(FirstLabel(hostName));
  return std::any_of(patterns.begin(), patterns.end(), [&](const std::string& pattern) {
    const std::string& name = pattern.find('.') == std::string::npos ? first : whole;
    return fnmatch(pattern.c_str(), name.c_str(), FNM_CASEFOLD | FNM_NOESCAPE) == 0;
  });
}

}  // namespace camd
