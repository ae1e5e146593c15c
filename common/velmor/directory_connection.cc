#include "velmor/directory_connection.h"

#include <sasl/sasl.h>

#include <ctime>
#include <memory>
#include <utility>

#include "velmor/failure.h"

namespace velmor {
namespace {

constexpr uint32_t kAccessDenied = 5;
constexpr uint32_t kInvalidDirectoryName = 267;
constexpr uint32_t kNoLogonServers = 1311;
constexpr uint32_t kInternalError = 1359;

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
      return kInvalidDirectoryName;
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
  throw Failure(StatusOf(error), text);
}

std::string FirstValue(LDAP* connection, LDAPMessage* entry, const char* attribute) {
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

// An address of version 6 stands in brackets.
std::string UriOf(const std::string& controller) {
  return "ldap://" + (controller.find(':') == std::string::npos ? controller : "[" + controller + "]");
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

std::string DirectoryEntry::Value(const std::string& attribute) const {
  const auto found = values.find(attribute);
  return found == values.end() ? "" : found->second;
}

std::optional<int64_t> ParseGeneralizedTime(const std::string& text) {
  tm parts = {};
  if (strptime(text.c_str(), "%Y%m%d%H%M%S", &parts) == nullptr) return std::nullopt;
  return timegm(&parts);
}

DirectoryConnection::DirectoryConnection(const std::string& controller, std::chrono::seconds timeout) {
  const std::string uri = UriOf(controller);
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

DirectoryConnection::DirectoryConnection(DirectoryConnection&& other) noexcept
    : connection_(std::exchange(other.connection_, nullptr)) {}

DirectoryConnection::~DirectoryConnection() {
  if (connection_ != nullptr) ldap_unbind_ext_s(connection_, nullptr, nullptr);
}

RootEntry DirectoryConnection::ReadRootEntry() {
  const auto entry =
      Find("", LDAP_SCOPE_BASE, "(objectClass=*)",
           {"dnsHostName", "defaultNamingContext", "configurationNamingContext", "currentTime"});
  if (!entry) throw Failure(kNoLogonServers, "the controller does not answer as a directory");
  return {entry->Value("dnsHostName"), entry->Value("defaultNamingContext"),
          entry->Value("configurationNamingContext"), entry->Value("currentTime")};
}

void DirectoryConnection::Bind() {
  Check(connection_,
        ldap_sasl_interactive_bind_s(connection_, nullptr, "GSSAPI", nullptr, nullptr, LDAP_SASL_QUIET,
                                     AnswerNothing, nullptr),
        "logging on to the directory");
}

std::string DirectoryConnection::NetbiosName(const RootEntry& root) {
  const auto entry = Find("CN=Partitions," + root.configurationDn, LDAP_SCOPE_ONELEVEL,
                          "(&(nETBIOSName=*)(nCName=" + root.baseDn + "))", {"nETBIOSName"});
  if (!entry) throw Failure(kInternalError, "the directory does not name the domain's NetBIOS name");
  return entry->Value("nETBIOSName");
}

bool DirectoryConnection::Exists(const std::string& dn) {
  return Find(dn, LDAP_SCOPE_BASE, "(objectClass=*)", {"objectClass"}).has_value();
}

void DirectoryConnection::Delete(const std::string& dn) {
  Check(connection_, ldap_delete_ext_s(connection_, dn.c_str(), nullptr, nullptr),
        "deleting the computer account");
}

std::optional<DirectoryEntry> DirectoryConnection::Find(const std::string& base, int scope,
                                                        const std::string& filter,
                                                        const std::vector<std::string>& attributes,
                                                        LDAPControl** controls) {
  std::vector<char*> names;
  names.reserve(attributes.size() + 1);
  for (const std::string& attribute : attributes) names.push_back(const_cast<char*>(attribute.c_str()));
  names.push_back(nullptr);
  LDAPMessage* found = nullptr;
  const int error = ldap_search_ext_s(connection_, base.c_str(), scope, filter.c_str(), names.data(), 0,
                                      controls, nullptr, nullptr, 0, &found);
  const Message message(found);
  if (error == LDAP_NO_SUCH_OBJECT) return std::nullopt;
  Check(connection_, error, "asking the directory");
  LDAPMessage* first = ldap_first_entry(connection_, found);
  if (first == nullptr) return std::nullopt;
  DirectoryEntry entry{NameOf(connection_, first), {}};
  for (const std::string& attribute : attributes)
    entry.values[attribute] = FirstValue(connection_, first, attribute.c_str());
  return entry;
}

}  // namespace velmor
