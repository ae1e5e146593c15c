#include "helper/directory.h"

#include <charconv>
#include <cstdlib>
#include <sstream>

#include "common/status.h"

namespace camd {
namespace {

// Makes a search show the owner in a security descriptor. Without it the controller would be asked for the
// audit entries too, which few may see, and would show nothing.
class OwnerOnly {
 public:
  OwnerOnly() : control_{oid_.data(), {static_cast<ber_len_t>(value_.size()), value_.data()}, 0} {}
  OwnerOnly(const OwnerOnly&) = delete;
  OwnerOnly& operator=(const OwnerOnly&) = delete;

  LDAPControl** Controls() { return controls_; }

 private:
  std::string oid_ = "1.2.840.113556.1.4.801";
  // A sequence of one number, the flag of the owner.
  std::string value_ = {0x30, 0x03, 0x02, 0x01, 0x01};
  LDAPControl control_;
  LDAPControl* controls_[2] = {&control_, nullptr};
};

int64_t NumberOf(const std::string& text) {
  int64_t number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number);
  return number;
}

// A text as a value in a filter.
std::string ForFilter(std::string text) {
  berval plain = {static_cast<ber_len_t>(text.size()), text.data()};
  berval escaped = {0, nullptr};
  if (ldap_bv2escaped_filter_value(&plain, &escaped) != 0)
    throw Failure(kNotEnoughMemory, "not enough memory");
  std::string result(escaped.bv_val, escaped.bv_len);
  if (escaped.bv_val != plain.bv_val) ldap_memfree(escaped.bv_val);
  return result;
}

}  // namespace

std::vector<std::string> ControllersOf(const std::string& domain) {
  char* list = nullptr;
  if (ldap_domain2hostlist(domain.c_str(), &list) != LDAP_SUCCESS || list == nullptr) {
    throw Failure(kNoLogonServers, "DNS names no controller of " + domain);
  }
  std::istringstream words(list);
  ldap_memfree(list);
  std::vector<std::string> controllers;
  for (std::string word; words >> word;) controllers.push_back(word.substr(0, word.find(':')));
  return controllers;
}

std::string SidText(const std::string& bytes) {
  const auto at = [&bytes](size_t index) {
    return static_cast<uint64_t>(static_cast<unsigned char>(bytes[index]));
  };
  if (bytes.size() < 8 || bytes.size() != 8 + 4 * at(1)) {
    throw Failure(kInternalError, "the directory gave a security identifier that is none");
  }
  uint64_t authority = 0;
  for (size_t index = 2; index < 8; ++index) authority = authority << 8 | at(index);
  std::string text = "S-" + std::to_string(at(0)) + "-" + std::to_string(authority);
  for (size_t index = 8; index < bytes.size(); index += 4) {
    text += "-" + std::to_string(at(index) | at(index + 1) << 8 | at(index + 2) << 16 | at(index + 3) << 24);
  }
  return text;
}

std::string OwnerText(const std::string& descriptor) {
  constexpr size_t kHeaderSize = 20;
  constexpr size_t kPlaceOfOwner = 4;
  constexpr size_t kSmallestSid = 8;
  if (descriptor.size() < kHeaderSize) return "";
  size_t begin = 0;
  for (size_t index = 4; index > 0; --index) {
    begin = begin << 8 | static_cast<unsigned char>(descriptor[kPlaceOfOwner + index - 1]);
  }
  if (begin == 0 || begin > descriptor.size() - kSmallestSid) return "";
  const size_t size =
      kSmallestSid + 4 * static_cast<size_t>(static_cast<unsigned char>(descriptor[begin + 1]));
  return size > descriptor.size() - begin ? "" : SidText(descriptor.substr(begin, size));
}

std::string Directory::DomainSid(const velmor::RootEntry& root) {
  const auto entry = Find(root.baseDn, LDAP_SCOPE_BASE, "(objectClass=*)", {"objectSid"});
  if (!entry) throw Failure(kInternalError, "the directory does not show the domain's own entry");
  return SidText(entry->Value("objectSid"));
}

std::string Directory::UserSid(const velmor::RootEntry& root, const std::string& user) {
  const auto entry =
      Find(root.baseDn, LDAP_SCOPE_SUBTREE, "(sAMAccountName=" + ForFilter(user) + ")", {"objectSid"});
  return entry ? SidText(entry->Value("objectSid")) : "";
}

std::optional<ComputerAccount> Directory::FindComputer(const velmor::RootEntry& root,
                                                       const std::string& computer) {
  OwnerOnly ownerOnly;
  const auto entry =
      Find(root.baseDn, LDAP_SCOPE_SUBTREE, "(sAMAccountName=" + computer + "$)",
           {"objectSid", "pwdLastSet", "lastLogon", "logonCount", "whenCreated", "nTSecurityDescriptor"},
           ownerOnly.Controls());
  if (!entry) return std::nullopt;
  ComputerAccount account;
  account.dn = entry->dn;
  account.sid = SidText(entry->Value("objectSid"));
  account.passwordSet = NumberOf(entry->Value("pwdLastSet"));
  account.lastLogon = NumberOf(entry->Value("lastLogon"));
  account.logonCount = NumberOf(entry->Value("logonCount"));
  account.created = velmor::ParseGeneralizedTime(entry->Value("whenCreated")).value_or(0);
  account.owner = OwnerText(entry->Value("nTSecurityDescriptor"));
  return account;
}

}  // namespace camd
