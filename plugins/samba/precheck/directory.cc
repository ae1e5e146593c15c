#include "precheck/directory.h"

#include <sasl/sasl.h>

#include <charconv>
#include <ctime>
#include <memory>
#include <optional>

#include "common/status.h"

namespace sambaprovider {
namespace {

struct MessageRelease {
  void operator()(LDAPMessage* message) const { ldap_msgfree(message); }
};
using Message = std::unique_ptr<LDAPMessage, MessageRelease>;

uint32_t StatusOfLdapError(int error) {
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
      return kInvalidOrganizationalUnit;
    default:
      return kInternalError;
  }
}

void Check(LDAP* connection, int error, const char* action) {
  if (error == LDAP_SUCCESS) return;
  char* detail = nullptr;
  ldap_get_option(connection, LDAP_OPT_DIAGNOSTIC_MESSAGE, &detail);
  std::string text = std::string(action) + ": " + ldap_err2string(error);
  if (detail != nullptr && *detail != '\0') text += std::string(" (") + detail + ")";
  ldap_memfree(detail);
  throw Failure(StatusOfLdapError(error), text);
}

// Searches; nothing when the base does not exist.
std::optional<Message> Search(LDAP* connection, const std::string& base, int scope, const std::string& filter,
                              const char* attribute1, const char* attribute2 = nullptr) {
  std::string name1 = attribute1;
  std::string name2 = attribute2 == nullptr ? "" : attribute2;
  char* attributes[] = {name1.data(), attribute2 == nullptr ? nullptr : name2.data(), nullptr};
  LDAPMessage* found = nullptr;
  const int error = ldap_search_ext_s(connection, base.c_str(), scope, filter.c_str(), attributes, 0, nullptr,
                                      nullptr, nullptr, 0, &found);
  Message message(found);
  if (error == LDAP_NO_SUCH_OBJECT) return std::nullopt;
  Check(connection, error, "searching the directory");
  return message;
}

std::string Value(LDAP* connection, LDAPMessage* entry, const char* attribute) {
  berval** values = ldap_get_values_len(connection, entry, attribute);
  if (values == nullptr) return "";
  const std::string value = values[0] == nullptr ? "" : std::string(values[0]->bv_val, values[0]->bv_len);
  ldap_value_free_len(values);
  return value;
}

std::string NameOf(LDAP* connection, LDAPMessage* entry) {
  char* dn = ldap_get_dn(connection, entry);
  const std::string name = dn == nullptr ? "" : dn;
  ldap_memfree(dn);
  return name;
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

bool IsControllersAccount(const std::string& userAccountControl) {
  constexpr uint32_t kServerTrustAccount = 0x2000;
  constexpr uint32_t kPartialSecretsAccount = 0x4000000;  // of a read-only controller
  int32_t flags = 0;
  const char* const end = userAccountControl.data() + userAccountControl.size();
  if (std::from_chars(userAccountControl.data(), end, flags).ptr != end) return false;
  return (static_cast<uint32_t>(flags) & (kServerTrustAccount | kPartialSecretsAccount)) != 0;
}

int64_t ParseGeneralizedTime(const std::string& text) {
  tm parts = {};
  const char* end = strptime(text.c_str(), "%Y%m%d%H%M%S", &parts);
  if (end == nullptr)
    throw Failure(kInternalError, "the controller's time is not understood: '" + text + "'");
  return timegm(&parts);
}

Directory::Directory(const std::string& controller, std::chrono::seconds timeout) {
  const bool isIpv6 = controller.find(':') != std::string::npos;
  const std::string uri = "ldap://" + (isIpv6 ? "[" + controller + "]" : controller);
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

Directory::~Directory() {
  ldap_unbind_ext_s(connection_, nullptr, nullptr);
}

RootEntry Directory::ReadRootEntry() {
  LDAPMessage* found = nullptr;
  const int error = ldap_search_ext_s(connection_, "", LDAP_SCOPE_BASE, "(objectClass=*)", nullptr, 0,
                                      nullptr, nullptr, nullptr, 0, &found);
  const Message message(found);
  Check(connection_, error, "asking for its time");
  LDAPMessage* entry = ldap_first_entry(connection_, found);
  if (entry == nullptr) throw Failure(kNoLogonServers, "the controller does not answer as a directory");
  return {Value(connection_, entry, "dnsHostName"), Value(connection_, entry, "defaultNamingContext"),
          Value(connection_, entry, "configurationNamingContext"),
          ParseGeneralizedTime(Value(connection_, entry, "currentTime"))};
}

void Directory::Bind() {
  Check(connection_,
        ldap_sasl_interactive_bind_s(connection_, nullptr, "GSSAPI", nullptr, nullptr, LDAP_SASL_QUIET,
                                     AnswerNothing, nullptr),
        "logging on to the directory");
}

std::string Directory::NetbiosName(const RootEntry& root) {
  const auto message = Search(connection_, "CN=Partitions," + root.configurationDn, LDAP_SCOPE_ONELEVEL,
                              "(&(nETBIOSName=*)(nCName=" + root.baseDn + "))", "nETBIOSName");
  LDAPMessage* entry = message ? ldap_first_entry(connection_, message->get()) : nullptr;
  if (entry == nullptr)
    throw Failure(kInternalError, "the directory does not name the domain's NetBIOS name");
  return Value(connection_, entry, "nETBIOSName");
}

ComputerAccount Directory::FindComputer(const RootEntry& root, const std::string& computer) {
  const auto message = Search(connection_, root.baseDn, LDAP_SCOPE_SUBTREE,
                              "(&(objectClass=computer)(sAMAccountName=" + computer + "$))", "dNSHostName",
                              "userAccountControl");
  LDAPMessage* entry = message ? ldap_first_entry(connection_, message->get()) : nullptr;
  if (entry == nullptr) return {};
  return {NameOf(connection_, entry), Value(connection_, entry, "dNSHostName"),
          IsControllersAccount(Value(connection_, entry, "userAccountControl"))};
}

bool Directory::Exists(const std::string& dn) {
  const auto message = Search(connection_, dn, LDAP_SCOPE_BASE, "(objectClass=*)", "objectClass");
  return message && ldap_first_entry(connection_, message->get()) != nullptr;
}

void Directory::Delete(const std::string& dn) {
  Check(connection_, ldap_delete_ext_s(connection_, dn.c_str(), nullptr, nullptr),
        "deleting the computer account");
}

}  // namespace sambaprovider
