#include "helper/netapi.h"

#include <cstring>

#include "common/status.h"
#include "velmor/netapi_code.h"

namespace sambaprovider::netapi {
namespace {

// libnetapi's own codes where the library wants another one.
constexpr uint32_t kMustRestart = 2713;  // success of the second half
constexpr uint32_t kNotFound = 1168;
constexpr uint32_t kAccountExpired = 1793;
constexpr uint32_t kPasswordMustChange = 1907;
constexpr uint32_t kDomainControllerNotFound = 1908;
constexpr uint32_t kUnableToFindController = 2453;
constexpr uint32_t kUnitRefused = 2694;

uint32_t StatusOf(uint32_t code) {
  switch (code) {
    case kNotFound:
      return kLogonFailure;
    case kAccountExpired:
      return kAccountDisabled;
    case kPasswordMustChange:
      return kPasswordExpired;
    case kDomainControllerNotFound:
    case kUnableToFindController:
      return kNoLogonServers;
    case kUnitRefused:
      // The unit was seen to exist before, so what is missing is the right to write into it.
      return kAccessDenied;
    default:
      return code;
  }
}

libnetapi_ctx* Context() {
  static libnetapi_ctx* const context = [] {
    libnetapi_ctx* made = nullptr;
    const uint32_t status = velmor::CodeOf(libnetapi_init(&made));
    if (status != 0) throw Failure(kInternalError, "libnetapi does not start: " + std::to_string(status));
    return made;
  }();
  return context;
}

void Check(const NET_API_STATUS& status, const char* action) {
  const uint32_t code = velmor::CodeOf(status);
  if (code == 0) return;
  const char* reason = libnetapi_get_error_string(Context(), static_cast<NET_API_STATUS>(code));
  throw Failure(StatusOf(code), std::string(action) + ": " + (reason == nullptr ? "" : reason) + " (code " +
                                    std::to_string(code) + ")");
}

// Without a server's name it looks for a domain controller, although it does not need one; a name that stands
// for this host spares that. It also insists on an account that it does not use.
NET_API_STATUS RemoveSecrets() {
  return NetUnjoinDomain("127.0.0.1", "none", "none", NETSETUP_JOIN_DOMAIN);
}

// A removal that did not reach the disk counts as a success. Only a host that has nothing left to remove is
// told that it is not joined.
void RequireSecretsAreGone() {
  if (velmor::CodeOf(RemoveSecrets()) == kNotJoined) return;
  throw Failure(kInternalError, "the machine's secrets could not be removed");
}

}  // namespace

velmor::Secret ProvisionAccount(const std::string& dnsDomain, const std::string& computer,
                                const std::string& organizationalUnitDn, const std::string& controller,
                                const std::string& user, const velmor::Secret& password) {
  Check(libnetapi_set_username(Context(), user.c_str()), "setting the user name");
  Check(libnetapi_set_password(Context(), password.Text()), "setting the password");
  const char* text = nullptr;
  Check(NetProvisionComputerAccount(dnsDomain.c_str(), computer.c_str(),
                                    organizationalUnitDn.empty() ? nullptr : organizationalUnitDn.c_str(),
                                    controller.c_str(), NETSETUP_PROVISION_REUSE_ACCOUNT, nullptr, nullptr,
                                    &text),
        "making the computer account");
  velmor::Secret blob{std::string_view(text)};
  char* const original = const_cast<char*>(text);
  explicit_bzero(original, blob.Size());
  NetApiBufferFree(original);
  return blob;
}

void StoreSecrets(const velmor::Secret& blob) {
  // The call takes UTF-16 with a byte order mark and a terminator.
  velmor::Secret wide(4 + 2 * blob.Size());
  char* to = wide.Data();
  *to++ = '\xff';
  *to++ = '\xfe';
  for (const char byte : blob.View()) {
    *to = byte;
    to += 2;
  }
  const NET_API_STATUS status =
      NetRequestOfflineDomainJoin(reinterpret_cast<uint8_t*>(wide.Data()), static_cast<uint32_t>(wide.Size()),
                                  NETSETUP_PROVISION_ONLINE_CALLER, nullptr);
  if (velmor::CodeOf(status) != kMustRestart) Check(status, "storing the machine's secrets");
}

void Unjoin(const std::string& user, const velmor::Secret& password) {
  Context();
  Check(NetUnjoinDomain(nullptr, user.c_str(), password.Text(), NETSETUP_JOIN_DOMAIN | NETSETUP_ACCT_DELETE),
        "leaving the domain");
  RequireSecretsAreGone();
}

void UnjoinLocally() {
  Context();
  Check(RemoveSecrets(), "removing the machine's secrets");
  RequireSecretsAreGone();
}

}  // namespace sambaprovider::netapi
