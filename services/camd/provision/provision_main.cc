// velmor-camd-provision: makes one computer account and returns the text for its offline join. A program of
// its own, because the library behind it keeps its state for the whole process, brings a Kerberos of its own,
// and must not take the service with it when it dies.
//
// Request: "domain", "realm", "netbiosDomain", "controller", "user", "computer", "container" (a DN, or empty
// for the default place), "takeOver" (whether an existing account may be used); the secret is the user's
// password. The answer's secret is the join text.
#include <cstdint>
#include <cstring>
#include <string>

#include "common/message.h"
#include "common/status.h"
#include "provision/private_configuration.h"
#include "velmor/netapi_code.h"

namespace camd {
namespace {

constexpr uint32_t kReuseAccount = NETSETUP_PROVISION_REUSE_ACCOUNT;

// The library's context; there is one in a process.
class Session {
 public:
  Session() {
    if (velmor::CodeOf(libnetapi_init(&context_)) != 0)
      throw Failure(kInternalError, "libnetapi cannot be used on this host");
  }
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  ~Session() { libnetapi_free(context_); }

  void LogOnAs(const std::string& user, const Secret& password) {
    if (velmor::CodeOf(libnetapi_set_username(context_, user.c_str())) != 0 ||
        velmor::CodeOf(libnetapi_set_password(context_, password.Text())) != 0) {
      throw Failure(kNotEnoughMemory, "not enough memory");
    }
  }

  Failure FailureOf(uint32_t status) const {
    char* detail = libnetapi_errstr(static_cast<NET_API_STATUS>(status));
    return Failure(status, std::string("the account could not be made: ") +
                               (detail == nullptr ? std::to_string(status) : detail));
  }

 private:
  libnetapi_ctx* context_ = nullptr;
};

const char* NullWhenEmpty(const std::string& text) {
  return text.empty() ? nullptr : text.c_str();
}

Message Provision(const Message& request) {
  const std::string netbiosDomain = request.Text("netbiosDomain");
  UsePrivateConfiguration(netbiosDomain, request.Text("realm"));
  Session session;
  session.LogOnAs(netbiosDomain + "\\" + request.Text("user"), request.secret);
  const std::string container = request.Text("container");
  const std::string controller = request.Text("controller");
  const uint32_t options = request.fields.value("takeOver", false) ? kReuseAccount : 0;
  const char* text = nullptr;
  const uint32_t status = velmor::CodeOf(NetProvisionComputerAccount(
      request.Text("domain").c_str(), request.Text("computer").c_str(), NullWhenEmpty(container),
      NullWhenEmpty(controller), options, nullptr, nullptr, &text));
  if (status != kSuccess) throw session.FailureOf(status);
  if (text == nullptr) throw Failure(kInternalError, "the account was made without a text for the join");
  Message answer;
  answer.secret = Secret(std::string_view(text));
  explicit_bzero(const_cast<char*>(text), answer.secret.Size());
  return answer;
}

}  // namespace
}  // namespace camd

int main() {
  return camd::ServeOneRequest(camd::Provision);
}
