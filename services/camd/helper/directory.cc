#include "helper/directory.h"

#include <sasl/sasl.h>

#include <charconv>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <sstream>
#include <utility>

#include "common/status.h"

namespace camd {
namespace {

struct MessageRelease {
  void operator()(LDAPMessage* message) const { ldap_msgfree(message); }
};
using Message = std::unique_ptr<LDAPMessage, MessageRelease>;

uint32_t StatusOf(int error) {
  switch (error) {
    case LDAP_SERVER_DOWN:
    case LDAP_TIMEOUT:
    case LDAP_CONNECT_ERROR:
    case LDAP_UNAVAILABLE:
    case LDAP_BUSY:
      return kNoLogonServers;
    case LDAP_INSUFFICIENT_ACCESS:
      return kAccessDenied;
    case LDAP_INVALID_DN_SYNTAX:
    case LDAP_NAMING_VIOLATION:
    case LDAP_REFERRAL:
      return kInvalidContainer;
    default:
      return kInternalError;
  }
}

void Check(LDAP* connection, int error, const char* action) {
  if (error == LDAP_SUCCESS) return;
  char* detail = nullptr;
  ldap_get_option(connection, LDAP_OPT_DIAGNOSTIC_MESSAGE, &detail);
  std::string text = std::string("the controller ") + action + ": " + ldap_err2string(error);
  if (detail != nullptr && *detail != '\0') text += std::string(" (") + detail + ")";
  ldap_memfree(detail);
  throw Failure(StatusOf(error), text);
}

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

// Searches; nothing when the base does not exist.
Message Search(LDAP* connection, const std::string& base, int scope, const std::string& filter,
               std::vector<std::string> attributes) {
  std::vector<char*> names;
  for (std::string& attribute : attributes) names.push_back(attribute.data());
  names.push_back(nullptr);
  LDAPMessage* found = nullptr;
  OwnerOnly ownerOnly;
  const int error = ldap_search_ext_s(connection, base.c_str(), scope, filter.c_str(), names.data(), 0,
                                      ownerOnly.Controls(), nullptr, nullptr, 0, &found);
  Message message(found);
  if (error == LDAP_NO_SUCH_OBJECT) return nullptr;
  Check(connection, error, "refused a search");
  return message;
}

LDAPMessage* FirstEntry(LDAP* connection, const Message& message) {
  return message == nullptr ? nullptr : ldap_first_entry(connection, message.get());
}

std::string Value(LDAP* connection, LDAPMessage* entry, const char* attribute) {
  berval** values = ldap_get_values_len(connection, entry, attribute);
  if (values == nullptr) return "";
  const std::string value = values[0] == nullptr ? "" : std::string(values[0]->bv_val, values[0]->bv_len);
  ldap_value_free_len(values);
  return value;
}

int64_t NumberValue(LDAP* connection, LDAPMessage* entry, const char* attribute) {
  const std::string text = Value(connection, entry, attribute);
  int64_t number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number);
  return number;
}

int64_t TimeValue(LDAP* connection, LDAPMessage* entry, const char* attribute) {
  tm parts = {};
  const std::string text = Value(connection, entry, attribute);
  return strptime(text.c_str(), "%Y%m%d%H%M%S", &parts) == nullptr ? 0 : timegm(&parts);
}

std::string NameOf(LDAP* connection, LDAPMessage* entry) {
  char* dn = ldap_get_dn(connection, entry);
  const std::string name = dn == nullptr ? "" : dn;
  ldap_memfree(dn);
  return name;
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

// GSSAPI asks for nothing: the ticket says who we are.
int AnswerNothing(LDAP* /*connection*/, unsigned int /*flags*/, void* /*defaults*/, void* interaction) {
  for (auto* prompt = static_cast<sasl_interact_t*>(interaction); prompt->id != SASL_CB_LIST_END; ++prompt) {
    prompt->result = "";
    prompt->len = 0;
  }
  return LDAP_SUCCESS;
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

Directory::Directory(const std::string& controller, std::chrono::seconds timeout) {
  const std::string uri = "ldap://" + controller;
  const int error = ldap_initialize(&connection_, uri.c_str());
  if (error != LDAP_SUCCESS) throw Failure(kInternalError, uri + ": " + ldap_err2string(error));
  const int version = LDAP_VERSION3;
  const timeval limit = {timeout.count(), 0};
  ldap_set_option(connection_, LDAP_OPT_PROTOCOL_VERSION, &version);
  ldap_set_option(connection_, LDAP_OPT_NETWORK_TIMEOUT, &limit);
  ldap_set_option(connection_, LDAP_OPT_TIMEOUT, &limit);
  ldap_set_option(connection_, LDAP_OPT_REFERRALS, LDAP_OPT_OFF);
  // The name in the ticket is the one we asked for, not what a reverse look-up makes of the address.
  ldap_set_option(connection_, LDAP_OPT_X_SASL_NOCANON, LDAP_OPT_ON);
}

Directory::Directory(Directory&& other) noexcept : connection_(std::exchange(other.connection_, nullptr)) {}

Directory::~Directory() {
  if (connection_ != nullptr) ldap_unbind_ext_s(connection_, nullptr, nullptr);
}

RootEntry Directory::ReadRootEntry() {
  const Message message = Search(connection_, "", LDAP_SCOPE_BASE, "(objectClass=*)",
                                 {"dnsHostName", "defaultNamingContext", "configurationNamingContext"});
  LDAPMessage* entry = FirstEntry(connection_, message);
  if (entry == nullptr) throw Failure(kNoLogonServers, "the controller does not answer as a directory");
  return {Value(connection_, entry, "dnsHostName"), Value(connection_, entry, "defaultNamingContext"),
          Value(connection_, entry, "configurationNamingContext")};
}

void Directory::Bind() {
  Check(connection_,
        ldap_sasl_interactive_bind_s(connection_, nullptr, "GSSAPI", nullptr, nullptr, LDAP_SASL_QUIET,
                                     AnswerNothing, nullptr),
        "refused the log-on");
}

std::string Directory::NetbiosName(const RootEntry& root) {
  const Message message = Search(connection_, "CN=Partitions," + root.configurationDn, LDAP_SCOPE_ONELEVEL,
                                 "(&(nETBIOSName=*)(nCName=" + root.baseDn + "))", {"nETBIOSName"});
  LDAPMessage* entry = FirstEntry(connection_, message);
  if (entry == nullptr)
    throw Failure(kInternalError, "the directory does not name the domain's NetBIOS name");
  return Value(connection_, entry, "nETBIOSName");
}

std::string Directory::DomainSid(const RootEntry& root) {
  const Message message = Search(connection_, root.baseDn, LDAP_SCOPE_BASE, "(objectClass=*)", {"objectSid"});
  LDAPMessage* entry = FirstEntry(connection_, message);
  if (entry == nullptr) throw Failure(kInternalError, "the directory does not show the domain's own entry");
  return SidText(Value(connection_, entry, "objectSid"));
}

std::string Directory::UserSid(const RootEntry& root, const std::string& user) {
  const Message message = Search(connection_, root.baseDn, LDAP_SCOPE_SUBTREE,
                                 "(sAMAccountName=" + ForFilter(user) + ")", {"objectSid"});
  LDAPMessage* entry = FirstEntry(connection_, message);
  return entry == nullptr ? "" : SidText(Value(connection_, entry, "objectSid"));
}

std::optional<ComputerAccount> Directory::FindComputer(const RootEntry& root, const std::string& computer) {
  const Message message =
      Search(connection_, root.baseDn, LDAP_SCOPE_SUBTREE, "(sAMAccountName=" + computer + "$)",
             {"objectSid", "pwdLastSet", "lastLogon", "logonCount", "whenCreated", "nTSecurityDescriptor"});
  LDAPMessage* entry = FirstEntry(connection_, message);
  if (entry == nullptr) return std::nullopt;
  ComputerAccount account;
  account.dn = NameOf(connection_, entry);
  account.sid = SidText(Value(connection_, entry, "objectSid"));
  account.passwordSet = NumberValue(connection_, entry, "pwdLastSet");
  account.lastLogon = NumberValue(connection_, entry, "lastLogon");
  account.logonCount = NumberValue(connection_, entry, "logonCount");
  account.created = TimeValue(connection_, entry, "whenCreated");
  account.owner = OwnerText(Value(connection_, entry, "nTSecurityDescriptor"));
  return account;
}

bool Directory::Exists(const std::string& dn) {
  const Message message = Search(connection_, dn, LDAP_SCOPE_BASE, "(objectClass=*)", {"objectClass"});
  return FirstEntry(connection_, message) != nullptr;
}

void Directory::Delete(const std::string& dn) {
  Check(connection_, ldap_delete_ext_s(connection_, dn.c_str(), nullptr, nullptr),
        "refused to delete the account");
}

}  // namespace camd
