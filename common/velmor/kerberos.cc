#include "velmor/kerberos.h"

#include <krb5/krb5.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <system_error>

namespace velmor {
namespace {

constexpr const char* kCache = "MEMORY:velmor";

[[noreturn]] void ThrowSystemError(const char* action) {
  throw std::system_error(errno, std::generic_category(), action);
}

// The Kerberos library's objects, released in reverse order.
class Session {
 public:
  Session() {
    const krb5_error_code error = krb5_init_context(&context_);
    if (error != 0)
      throw KerberosError(error, "Kerberos cannot be used on this host: error " + std::to_string(error));
  }
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session() {
    krb5_free_cred_contents(context_, &credentials_);
    if (exchange_ != nullptr) krb5_init_creds_free(context_, exchange_);
    krb5_get_init_creds_opt_free(context_, options_);
    krb5_free_principal(context_, principal_);
    if (cache_ != nullptr) krb5_cc_close(context_, cache_);
    krb5_free_context(context_);
  }

  void SetUser(const std::string& realm, const std::string& user, NameForm form) {
    Check(krb5_build_principal(context_, &principal_, static_cast<unsigned int>(realm.size()), realm.c_str(),
                               user.c_str(), static_cast<char*>(nullptr)));
    Check(krb5_get_init_creds_opt_alloc(context_, &options_));
    if (form != NameForm::Enterprise) return;
    principal_->type = KRB5_NT_ENTERPRISE_PRINCIPAL;
    krb5_get_init_creds_opt_set_canonicalize(options_, 1);
  }

  // Not krb5_get_init_creds_password: that asks a second controller when the first one refuses.
  void GetTicket(const Secret& password) {
    Check(krb5_init_creds_init(context_, principal_, nullptr, nullptr, 0, options_, &exchange_));
    Check(krb5_init_creds_set_password(context_, exchange_, password.Text()));
    Check(krb5_init_creds_get(context_, exchange_));
    Check(krb5_init_creds_get_creds(context_, exchange_, &credentials_));
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
    const std::string text = message;
    krb5_free_error_message(context_, message);
    throw KerberosError(error, text);
  }

  krb5_context context_ = nullptr;
  krb5_principal principal_ = nullptr;
  krb5_get_init_creds_opt* options_ = nullptr;
  krb5_init_creds_context exchange_ = nullptr;
  krb5_creds credentials_ = {};
  krb5_ccache cache_ = nullptr;
};

std::string Settings(const std::string& realm, const std::string& controller) {
  std::string settings =
      "[libdefaults]\n  rdns = false\n  dns_canonicalize_hostname = false\n  dns_lookup_kdc = true\n";
  if (!controller.empty()) settings += "[realms]\n  " + realm + " = {\n    kdc = " + controller + "\n  }\n";
  return settings;
}

}  // namespace

void DirectKerberosTo(const std::string& realm, const std::string& controller) {
  const std::string settings = Settings(realm, controller);
  // A file in memory, for the libraries read settings from files only. It stays open until the process ends.
  const int file = memfd_create("krb5.conf", MFD_CLOEXEC);
  if (file < 0 || write(file, settings.data(), settings.size()) != static_cast<ssize_t>(settings.size()))
    ThrowSystemError("cannot make a file in memory");
  const std::string path = "/proc/self/fd/" + std::to_string(file) + ":/etc/krb5.conf";
  if (setenv("KRB5_CONFIG", path.c_str(), 1) != 0 || setenv("KRB5CCNAME", kCache, 1) != 0)
    ThrowSystemError("cannot change the environment");
}

void LogOn(const std::string& realm, const std::string& user, NameForm form, const Secret& password) {
  // Tickets in a MEMORY cache live as long as the process, not as long as the session that put them there.
  Session session;
  session.SetUser(realm, user, form);
  session.GetTicket(password);
  session.KeepTicket();
}

}  // namespace velmor
