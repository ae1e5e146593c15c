#include "common/names.h"

#include <arpa/inet.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>

#include "common/files.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr size_t kLongestComputerName = 15;
constexpr size_t kLongestDnsName = 255;
constexpr size_t kLongestLabel = 63;

// The host's locale must not matter here, so not <cctype>.
char Lower(char byte) {
  return byte >= 'A' && byte <= 'Z' ? static_cast<char>(byte - 'A' + 'a') : byte;
}
char Upper(char byte) {
  return byte >= 'a' && byte <= 'z' ? static_cast<char>(byte - 'a' + 'A') : byte;
}
bool IsDigit(char byte) {
  return byte >= '0' && byte <= '9';
}
bool IsLetterOrDigit(char byte) {
  return IsDigit(byte) || (Lower(byte) >= 'a' && Lower(byte) <= 'z');
}

bool IsDnsLabel(std::string_view label) {
  return !label.empty() && label.size() <= kLongestLabel && label.front() != '-' && label.back() != '-' &&
         std::all_of(label.begin(), label.end(),
                     [](char byte) { return IsLetterOrDigit(byte) || byte == '-' || byte == '_'; });
}

bool IsAddress(const std::string& name) {
  std::array<unsigned char, sizeof(in6_addr)> address = {};
  return inet_pton(AF_INET, name.c_str(), address.data()) == 1 ||
         inet_pton(AF_INET6, name.c_str(), address.data()) == 1;
}

}  // namespace

std::string LowerCase(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), Lower);
  return result;
}

std::string UpperCase(std::string_view text) {
  std::string result(text);
  std::transform(result.begin(), result.end(), result.begin(), Upper);
  return result;
}

bool EqualWithoutCase(std::string_view left, std::string_view right) {
  return LowerCase(left) == LowerCase(right);
}

bool IsComputerName(std::string_view name) {
  return !name.empty() && name.size() <= kLongestComputerName && name.front() != '-' && name.back() != '-' &&
         std::all_of(name.begin(), name.end(),
                     [](char byte) { return IsLetterOrDigit(byte) || byte == '-'; }) &&
         !std::all_of(name.begin(), name.end(), IsDigit);
}

bool IsDnsName(std::string_view name) {
  if (name.size() > kLongestDnsName) return false;
  for (;;) {
    const size_t dot = name.find('.');
    if (!IsDnsLabel(name.substr(0, dot))) return false;
    if (dot == std::string_view::npos) return true;
    name.remove_prefix(dot + 1);
  }
}

bool IsNetbiosName(std::string_view name) {
  return !name.empty() && name.size() <= kLongestComputerName &&
         std::all_of(name.begin(), name.end(), [](char byte) {
           return IsLetterOrDigit(byte) ||
                  std::string_view("-_.!@#$^&()'{}~").find(byte) != std::string_view::npos;
         });
}

bool IsControllerName(std::string_view name) {
  return IsDnsName(name) || IsAddress(std::string(name));
}

AccountName SplitAccountName(std::string_view name) {
  if (const size_t slash = name.find('\\'); slash != std::string_view::npos) {
    return {std::string(name.substr(slash + 1)), std::string(name.substr(0, slash))};
  }
  if (const size_t at = name.rfind('@'); at != std::string_view::npos) {
    return {std::string(name.substr(0, at)), std::string(name.substr(at + 1))};
  }
  return {std::string(name), ""};
}

std::string WithoutTrailingDot(std::string_view domain) {
  if (domain.size() > 1 && domain.back() == '.') domain.remove_suffix(1);
  return std::string(domain);
}

std::string DomainDn(std::string_view dnsDomain) {
  std::string dn = "DC=";
  for (const char byte : dnsDomain) {
    if (byte == '.') {
      dn += ",DC=";
    } else {
      dn += byte;
    }
  }
  return dn;
}

std::string HostShortName() {
  std::array<char, 256> buffer = {};
  if (gethostname(buffer.data(), buffer.size() - 1) != 0) {
    throw Failure(kInvalidComputerName, "the host's name cannot be read: " + ErrorText(errno));
  }
  const std::string_view whole(buffer.data());
  const std::string shortName(whole.substr(0, whole.find('.')));
  if (!IsComputerName(shortName)) {
    throw Failure(kInvalidComputerName,
                  "'" + shortName +
                      "' cannot be a computer account's name: it needs 1 to 15 letters, digits "
                      "and hyphens, and at least one letter");
  }
  return shortName;
}

std::string HostDnsName(std::string_view shortName, std::string_view dnsDomain) {
  return LowerCase(shortName) + "." + LowerCase(dnsDomain);
}

}  // namespace sambaprovider
