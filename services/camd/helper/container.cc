#include "helper/container.h"

#include <ldap.h>

#include <memory>

#include "common/status.h"

namespace camd {
namespace {

struct DnRelease {
  void operator()(LDAPRDN* dn) const { ldap_dnfree(dn); }
};

[[noreturn]] void Refuse(std::string_view text) {
  throw Failure(kInvalidContainer, "'" + std::string(text) + "' names no container");
}

// The name in the library's own form, or nothing when it is none.
std::string Normalized(const std::string& dn) {
  LDAPDN parts = nullptr;
  if (ldap_str2dn(dn.c_str(), &parts, LDAP_DN_FORMAT_LDAPV3) != LDAP_SUCCESS) return "";
  const std::unique_ptr<LDAPRDN, DnRelease> owner(parts);
  char* text = nullptr;
  if (ldap_dn2str(parts, &text, LDAP_DN_FORMAT_LDAPV3 | LDAP_DN_PRETTY) != LDAP_SUCCESS) return "";
  const std::string result = text;
  ldap_memfree(text);
  // The library takes a part without a name. Inside a name both characters would be escaped.
  return result.find("=,") == std::string::npos ? result : "";
}

std::string FirstType(std::string_view part) {
  std::string type;
  for (const char byte : part.substr(0, 3))
    type += static_cast<char>(byte >= 'a' && byte <= 'z' ? byte - 32 : byte);
  return type;
}

bool HasType(std::string_view part) {
  const std::string type = FirstType(part);
  return type == "OU=" || type == "CN=" || type == "DC=";
}

std::string Escaped(std::string_view value) {
  std::string result;
  for (size_t at = 0; at < value.size(); ++at) {
    const bool special = std::string_view(",+\"\\<>;=").find(value[at]) != std::string_view::npos;
    const bool outer = value[at] == ' ' && (at == 0 || at + 1 == value.size());
    if (special || outer || (at == 0 && value[at] == '#')) result += '\\';
    result += value[at];
  }
  return result;
}

std::string FromPath(std::string_view path, std::string_view baseDn) {
  std::string dn(baseDn);
  while (!path.empty()) {
    const size_t slash = path.find('/');
    const std::string_view part = path.substr(0, slash);
    if (!part.empty()) {
      const std::string type = HasType(part) ? FirstType(part) : "OU=";
      const std::string_view name = HasType(part) ? part.substr(3) : part;
      if (name.empty()) return "";
      dn = type + Escaped(name) + "," + dn;
    }
    path.remove_prefix(slash == std::string_view::npos ? path.size() : slash + 1);
  }
  return dn.size() == baseDn.size() ? "" : dn;
}

// Whether the last part of a name that has several is the domain's.
bool EndsInDomain(std::string_view dn) {
  const size_t comma = dn.rfind(',');
  if (comma == std::string_view::npos) return false;
  const size_t begin = dn.find_first_not_of(' ', comma + 1);
  return begin != std::string_view::npos && FirstType(dn.substr(begin)) == "DC=";
}

}  // namespace

std::string ContainerDn(std::string_view text, std::string_view baseDn) {
  for (const char byte : text) {
    if (static_cast<unsigned char>(byte) < ' ') Refuse("a text with control characters");
  }
  std::string dn;
  if (EndsInDomain(text)) {
    dn = Normalized(std::string(text));
  } else if (HasType(text) && text.find('/') == std::string_view::npos) {
    dn = Normalized(std::string(text) + "," + std::string(baseDn));
  } else {
    dn = Normalized(FromPath(text, baseDn));
  }
  if (dn.empty()) Refuse(text);
  return dn;
}

}  // namespace camd
