#include "helper/kerberos.h"

#include <krb5/krb5.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>

#include "common/status.h"

namespace camd {
namespace {

constexpr const char* kCache = "MEMORY:velmor-camd";

uint32_t StatusOf(krb5_error_code error) {
  switch (error) {
    case KRB5KDC_ERR_PREAUTH_FAILED:
    case KRB5KRB_AP_ERR_BAD_INTEGRITY:
    case KRB5_PREAUTH_FAILED:
    case KRB5KDC_ERR_C_PRINCIPAL_UNKNOWN:
    case KRB5KDC_ERR_CLIENT_REVOKED:
    case KRB5KDC_ERR_NAME_EXP:
    case KRB5KDC_ERR_KEY_EXP:
    case KRB5KDC_ERR_POLICY:
      return kServiceLogonFailed;
    case KRB5KRB_AP_ERR_SKEW:
    case KRB5_KDCREP_SKEW:
      return kTimeSkew;
    case KRB5_KDC_UNREACH:
    case KRB5_REALM_UNKNOWN:
    case KRB5_REALM_CANT_RESOLVE:
      return kNoLogonServers;
    default:
      return kInternalError;
  }
}

// The Kerberos library's objects, released in reverse order.
class Session {
 public:
  Session() {
    const krb5_error_code error = krb5_init_context(&context_);
    if (error != 0) throw Failure(kInternalError, "Kerberos cannot be used: " + ErrorText(error));
  }
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session() {
    krb5_free_cred_contents(context_, &credentials_);
    krb5_free_principal(context_, principal_);
    if (cache_ != nullptr) krb5_cc_close(context_, cache_);
    krb5_free_context(context_);
  }

  void GetTicket(const std::string& realm, const std::string& user, const Secret& password) {
    Check(krb5_build_principal(context_, &principal_, static_cast<unsigned int>(realm.size()), realm.c_str(),
                               user.c_str(), static_cast<char*>(nullptr)));
    Check(krb5_get_init_creds_password(context_, &credentials_, principal_, password.Text(), nullptr, nullptr,
                                       0, nullptr, nullptr));
  }

  void KeepTicket() {
    Check(krb5_cc_resolve(context_, kCache, &cache_));
    Check(krb5_cc_initialize(context_, cache_, credentials_.client));
    Check(krb5_cc_store_cred(context_, cache_, &credentials_));
  }

 private:
  void Check(krb5_error_code error) const {
    if (error == 0) return;
    const char* message = krb5_get_error_message(context_, error);
    const std::string text = std::string("the service's account cannot log on: ") + message;
    krb5_free_error_message(context_, message);
    throw Failure(StatusOf(error), text);
  }

  krb5_context context_ = nullptr;
  krb5_principal principal_ = nullptr;
  krb5_creds credentials_ = {};
  krb5_ccache cache_ = nullptr;
};

}  // namespace

void PrepareKerberos(const std::string& realm, const std::string& controller) {
  std::string settings =
      "[libdefaults]\n  rdns = false\n  dns_canonicalize_hostname = false\n  dns_lookup_kdc = true\n";
  if (!controller.empty()) settings += "[realms]\n  " + realm + " = {\n    kdc = " + controller + "\n  }\n";
  // A file in memory, for the libraries read settings from files only. It stays open until the process ends.
  const int file = memfd_create("krb5.conf", MFD_CLOEXEC);
  if (file < 0 || write(file, settings.data(), settings.size()) != static_cast<ssize_t>(settings.size())) {
    throw Failure(kInternalError, "cannot make a file in memory: " + ErrorText(errno));
  }
  const std::string path = "/proc/self/fd/" + std::to_string(file) + ":/etc/krb5.conf";
  if (setenv("KRB5_CONFIG", path.c_str(), 1) != 0 || setenv("KRB5CCNAME", kCache, 1) != 0) {
    throw Failure(kNotEnoughMemory, "not enough memory");
  }
}

void LogOn(const std::string& realm, const std::string& user, const Secret& password) {
  // Tickets in a MEMORY cache live as long as the process, not as long as the session that put them there.
  Session session;
  session.GetTicket(realm, user, password);
  session.KeepTicket();
}

}  // namespace camd
