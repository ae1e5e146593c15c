// velmor-samba-precheck: tries a password once with Kerberos and looks at the directory with it.
//
// A process of its own, because MIT Kerberos, which OpenLDAP's log-on uses, and the Kerberos that libnetapi
// brings do not mix. Reads one request (common/message.h) and answers it:
//
//   "operation": "inspect" or "remove"
//   "dnsDomain", "user", "controllers" (names, best first), "computer", and the password as the secret
//   "organizationalUnit": for inspect; may be empty
//   "computerDnsName": for remove; the account is deleted only when it has this DNS host name, or none
//
// An answer has "step", where it stopped: "connect", "password", "clock" or "account". An inspect with status
// 0 adds "controller", "netbiosDomain", "organizationalUnitDn", "accountDn" and "accountHostName".
#include <sys/prctl.h>

#include <cstdlib>
#include <ctime>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "common/message.h"
#include "common/names.h"
#include "common/organizational_unit.h"
#include "common/status.h"
#include "precheck/directory.h"
#include "precheck/kerberos.h"
#include "velmor/kerberos.h"

namespace sambaprovider {
namespace {

constexpr std::chrono::seconds kLdapTimeout{5};
constexpr size_t kMostControllers = 4;
constexpr int64_t kLargestSkew = 300;

class Precheck {
 public:
  explicit Precheck(const Request& request) : request_(request) {}

  // How far it has got, for the answer.
  nlohmann::json Progress() const { return {{"step", step_}, {"done", done_}}; }

  nlohmann::json Answer() {
    Connect();
    CheckPassword();
    CheckClock();
    NextStep("account", "the clocks differ by " + std::to_string(offset_) + " s");
    directory_->Bind();
    return request_.Text("operation") == "remove" ? Remove() : Inspect();
  }

 private:
  // Finds the first controller that answers. It is asked everything that follows, so that no replication lag
  // between two of them can be seen.
  void Connect() {
    std::string reasons;
    const auto controllers = request_.fields.value("controllers", std::vector<std::string>());
    for (size_t index = 0; index < controllers.size() && index < kMostControllers; ++index) {
      try {
        directory_ = std::make_unique<Directory>(controllers[index], kLdapTimeout);
        root_ = directory_->ReadRootEntry();
        RequireDomain();
        controller_ = root_.controllerDnsName.empty() ? controllers[index] : root_.controllerDnsName;
        offset_ = ControllersTime() - time(nullptr);
        return;
      } catch (const Failure& failure) {
        reasons += "; " + controllers[index] + ": " + failure.what();
      }
    }
    throw Failure(kNoLogonServers, "no domain controller answers" + reasons);
  }

  // A preferred controller may be one of another domain.
  void RequireDomain() const {
    if (EqualWithoutCase(root_.baseDn, DomainDn(request_.Text("dnsDomain")))) return;
    throw Failure(kNoLogonServers, "serves another domain, " + root_.baseDn);
  }

  int64_t ControllersTime() const {
    if (const auto seconds = velmor::ParseGeneralizedTime(root_.currentTime)) return *seconds;
    throw Failure(kInternalError, "the controller's time is not understood: '" + root_.currentTime + "'");
  }

  void CheckPassword() {
    NextStep("password", controller_ + " answers");
    const std::string realm = UpperCase(request_.Text("dnsDomain"));
    velmor::DirectKerberosTo(realm, controller_);
    try {
      LogOn(realm, SplitAccountName(request_.Text("user")), request_.secret);
    } catch (const Failure& failure) {
      throw Failure(failure.Code(), request_.Text("user") + " was refused, tried once: " + failure.what());
    }
  }

  void CheckClock() {
    NextStep("clock", "the password of " + request_.Text("user") + " is accepted");
    if (std::abs(offset_) <= kLargestSkew) return;
    throw Failure(kTimeSkew, controller_ + "'s clock differs from the host's by " + std::to_string(offset_) +
                                 " seconds; at most " + std::to_string(kLargestSkew) + " are allowed");
  }

  // The account of a controller is never the host's own, whatever DNS name it has.
  ComputerAccount FindAccount() {
    const ComputerAccount account = directory_->FindComputer(root_, request_.Text("computer"));
    if (!account.isController) return account;
    throw Failure(kAccountExists, account.dn + " is the account of a domain controller");
  }

  nlohmann::json Remove() {
    const ComputerAccount account = FindAccount();
    std::string text = "there is no computer account to remove";
    if (!account.dn.empty()) {
      if (!account.dnsHostName.empty() &&
          !EqualWithoutCase(account.dnsHostName, request_.Text("computerDnsName"))) {
        throw Failure(kAccountExists, account.dn + " belongs to " + account.dnsHostName);
      }
      directory_->Delete(account.dn);
      text = "removed " + account.dn;
    }
    return {{"status", kSuccess}, {"text", text}};
  }

  nlohmann::json Inspect() {
    const ComputerAccount account = FindAccount();
    return {{"status", kSuccess},
            {"text",
             controller_ + " accepts the password; its clock differs by " + std::to_string(offset_) + " s"},
            {"step", step_},
            {"controller", controller_},
            {"netbiosDomain", directory_->NetbiosName(root_)},
            {"organizationalUnitDn", FindOrganizationalUnit()},
            {"accountDn", account.dn},
            {"accountHostName", account.dnsHostName}};
  }

  std::string FindOrganizationalUnit() {
    const std::string text = request_.Text("organizationalUnit");
    if (text.empty()) return "";
    const std::string dn = OrganizationalUnitDn(text, root_.baseDn);
    if (directory_->Exists(dn)) return dn;
    throw Failure(kInvalidOrganizationalUnit, "the organisational unit " + dn + " does not exist");
  }

  // Ends the present step with a text and begins another one.
  void NextStep(const char* step, const std::string& text) {
    done_.push_back({step_, text});
    step_ = step;
  }

  const Request& request_;
  std::string step_ = "connect";
  std::vector<std::pair<std::string, std::string>> done_;
  std::unique_ptr<Directory> directory_;
  velmor::RootEntry root_;
  std::string controller_;
  int64_t offset_ = 0;
};

nlohmann::json AnswerRequest(const Request& request) {
  Precheck precheck(request);
  nlohmann::json answer;
  try {
    answer = precheck.Answer();
  } catch (const Failure& failure) {
    answer = {{"status", failure.Code()}, {"text", failure.what()}};
  } catch (const std::exception& error) {
    answer = {{"status", kInternalError}, {"text", error.what()}};
  }
  answer.update(precheck.Progress());
  return answer;
}

}  // namespace
}  // namespace sambaprovider

int main() {
  // A core file would hold the password.
  prctl(PR_SET_DUMPABLE, 0, 0, 0, 0);
  try {
    const sambaprovider::Request request = sambaprovider::ReceiveRequest();
    sambaprovider::SendAnswer(sambaprovider::AnswerRequest(request));
  } catch (const sambaprovider::Failure& failure) {
    sambaprovider::SendAnswer({{"status", failure.Code()}, {"text", failure.what()}});
  }
  return 0;
}
