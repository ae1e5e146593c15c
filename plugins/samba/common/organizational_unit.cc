#include "common/organizational_unit.h"

#include <algorithm>
#include <vector>

#include "common/names.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

bool HasPrefix(std::string_view text, std::string_view lowerCasePrefix) {
  return LowerCase(text.substr(0, lowerCasePrefix.size())) == lowerCasePrefix;
}

std::string_view Trimmed(std::string_view text) {
  const size_t first = text.find_first_not_of(' ');
  if (first == std::string_view::npos) return {};
  return text.substr(first, text.find_last_not_of(' ') - first + 1);
}

// Splits at a separator that no backslash stands before.
std::vector<std::string_view> Split(std::string_view text, char separator) {
  std::vector<std::string_view> parts;
  size_t begin = 0;
  for (size_t at = 0; at < text.size(); ++at) {
    if (text[at] == '\\') {
      ++at;
    } else if (text[at] == separator) {
      parts.push_back(Trimmed(text.substr(begin, at - begin)));
      begin = at + 1;
    }
  }
  parts.push_back(Trimmed(text.substr(begin)));
  return parts;
}

bool IsRelativeName(std::string_view part) {
  return HasPrefix(part, "ou=") || HasPrefix(part, "cn=");
}

std::string Escaped(std::string_view value) {
  std::string result;
  for (size_t at = 0; at < value.size(); ++at) {
    const bool special = std::string_view(",+\"\\<>;=").find(value[at]) != std::string_view::npos;
    if (special || (at == 0 && value[at] == '#')) result += '\\';
    result += value[at];
  }
  return result;
}

std::string RelativeName(std::string_view part) {
  const std::string type = HasPrefix(part, "cn=") ? "CN=" : "OU=";
  if (IsRelativeName(part)) part = Trimmed(part.substr(type.size()));
  if (part.empty())
    throw Failure(kInvalidOrganizationalUnit, "a part of the organisational unit has no name");
  return type + Escaped(part);
}

std::string FromPath(std::string_view path, std::string_view baseDn) {
  std::string dn(baseDn);
  bool any = false;
  while (!path.empty()) {
    const size_t slash = path.find('/');
    const std::string_view part = Trimmed(path.substr(0, slash));
    if (!part.empty()) {
      dn = RelativeName(part) + "," + dn;
      any = true;
    }
    path.remove_prefix(slash == std::string_view::npos ? path.size() : slash + 1);
  }
  if (!any) throw Failure(kInvalidOrganizationalUnit, "the organisational unit has no name");
  return dn;
}

}  // namespace

std::string OrganizationalUnitDn(std::string_view text, std::string_view baseDn) {
  if (std::any_of(text.begin(), text.end(),
                  [](char byte) { return static_cast<unsigned char>(byte) < ' '; })) {
    throw Failure(kInvalidOrganizationalUnit, "the organisational unit has a control character");
  }
  const std::vector<std::string_view> components = Split(text, ',');
  if (components.size() > 1 && HasPrefix(components.back(), "dc=")) return std::string(text);
  // "OU=Hosts,OU=Servers" runs from the bottom to the top; "OU=Servers/OU=Hosts" is one component.
  if (components.size() > 1 && std::all_of(components.begin(), components.end(), IsRelativeName)) {
    return std::string(text) + "," + std::string(baseDn);
  }
  return FromPath(text, baseDn);
}

}  // namespace sambaprovider
