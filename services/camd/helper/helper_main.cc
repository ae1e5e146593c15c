// velmor-camd-helper: one operation in the directory, with the service's account. The request has
// "operation", "domain" (a DNS name), "controller" (empty: the ones that DNS names), "user", and as its
// secret the user's password.
//
// "domain"         answers "netbiosDomainName", "dnsDomainName", "domainSid".
// "create"         makes the account "computer" in "container" (empty: the default place). An account that
// exists is
//                  refused with kAccountExists, unless "takeOver" is "any", or is "own-unused" and the
//                  account is unused, as below. Answers "accountName", "dn", and the account's record; the
//                  secret is the text for the join.
// "remove-unused"  deletes the account "computer" if it is unused. kNotFound when it is gone, kAccountInUse
// when it
//                  is used or another's.
//
// An account's record is "sid", "recordedBy" (the controller that was asked), "passwordSet", "lastLogon" and
// "logonCount". Provisioning itself logs on with a new account, and controllers do not tell each other of
// log-ons: an account is unused when the controller of the record still gives the same, no other one has seen
// it log on, and it was not made before "createdAfter" (seconds since 1970). Without a "sid" the record is
// that of a request whose outcome nobody learnt; then the account must be of our own user's making, from the
// time when that request may have run, and nothing may have happened to it since the time that making it
// takes.
#include "common/message.h"
#include "common/status.h"
#include "helper/container.h"
#include "helper/directory.h"
#include "helper/kerberos.h"
#include "velmor/kerberos.h"

namespace camd {
namespace {

constexpr const char* kProvisioningProgram = "/usr/libexec/velmor/velmor-camd-provision";
constexpr std::chrono::seconds kControllerTimeout(5);
constexpr std::chrono::minutes kProvisioningTimeout(2);
// The controller's clock and ours may differ by as much as Kerberos allows.
constexpr int64_t kClockSkewSeconds = 300;
// How long the provisioning of one account may have taken.
constexpr int64_t kMakingSeconds = 120;
// How long a request may have run; more cannot be configured.
constexpr int64_t kLongestRequestSeconds = 600;

std::string UpperCase(std::string text) {
  for (char& byte : text) byte = static_cast<char>(byte >= 'a' && byte <= 'z' ? byte - 32 : byte);
  return text;
}

// The directory counts in units of 100 ns since 1601.
int64_t FileTimeOf(int64_t secondsSince1970) {
  return (secondsSince1970 + 11'644'473'600) * 10'000'000;
}

// A controller that has answered and to which we have logged on.
struct Connection {
  Directory directory;
  velmor::RootEntry root;
};

Connection Connect(const Message& request) {
  const std::string domain = request.Text("domain");
  const std::string realm = UpperCase(domain);
  const std::string wanted = request.Text("controller");
  velmor::DirectKerberosTo(realm, wanted);
  LogOn(realm, request.Text("user"), request.secret);
  const std::vector<std::string> controllers =
      wanted.empty() ? ControllersOf(domain) : std::vector<std::string>{wanted};
  for (const std::string& controller : controllers) {
    try {
      Directory directory(controller, kControllerTimeout);
      directory.ReadRootEntry();
      directory.Bind();
      // Once more: what it said before it showed who it is decides nothing.
      const velmor::RootEntry root = directory.ReadRootEntry();
      return {std::move(directory), root};
    } catch (const Failure& failure) {
      if (failure.Code() != kNoLogonServers) throw;
    }
  }
  throw Failure(kNoLogonServers, "no controller of " + domain + " answers");
}

Message TellDomain(const Message& request) {
  Connection connection = Connect(request);
  Message answer;
  answer.fields["netbiosDomainName"] = connection.directory.NetbiosName(connection.root);
  answer.fields["dnsDomainName"] = request.Text("domain");
  answer.fields["domainSid"] = connection.directory.DomainSid(connection.root);
  return answer;
}

std::string CheckedContainer(Connection& connection, const std::string& text) {
  if (text.empty()) return "";
  const std::string dn = ContainerDn(text, connection.root.baseDn);
  if (!connection.directory.Exists(dn)) throw Failure(kInvalidContainer, "there is no container " + dn);
  return dn;
}

// The provisioning library has one number for a container that does not exist, which was looked at before,
// and for one in which the service may not create accounts.
uint32_t StatusOfProvisioning(uint32_t status) {
  constexpr uint32_t kOrganizationalUnitFailed = 2694;
  constexpr uint32_t kControllerNotFound = 2453;
  constexpr uint32_t kAccountFound = 2691;
  switch (status) {
    case kOrganizationalUnitFailed:
      return kAccessDenied;
    case kControllerNotFound:
      return kNoLogonServers;
    case kAccountFound:
      return kAccountExists;
    case kLogonFailure:
      return kServiceLogonFailed;
    default:
      return status;
  }
}

Message Provision(const Message& request, Connection& connection, const std::string& container,
                  bool takeOver) {
  Message order;
  order.fields = {{"domain", request.Text("domain")},
                  {"realm", UpperCase(request.Text("domain"))},
                  {"netbiosDomain", connection.directory.NetbiosName(connection.root)},
                  {"controller", connection.root.controllerDnsName},
                  {"user", request.Text("user")},
                  {"computer", request.Text("computer")},
                  {"container", container},
                  {"takeOver", takeOver}};
  order.secret = Secret(request.secret.View());
  try {
    return Ask(kProvisioningProgram, order, kProvisioningTimeout);
  } catch (const Failure& failure) {
    const uint32_t status = StatusOfProvisioning(failure.Code());
    if (status == kAccessDenied) throw Failure(status, "the service may not make accounts there");
    throw Failure(status, failure.what());
  }
}

// Whether the account is what a request left that never learnt its outcome. Somebody else may have made one
// of the same name since, which also logs on in its first minutes.
bool LooksLeftBehind(const ComputerAccount& account, const Message& request, const std::string& ourSid) {
  if (ourSid.empty() || account.owner != ourSid) return false;
  const int64_t latest = request.Number("createdAfter") + kLongestRequestSeconds + kClockSkewSeconds;
  const int64_t madeUntil = FileTimeOf(account.created + kMakingSeconds);
  return account.created <= latest && account.passwordSet <= madeUntil && account.lastLogon <= madeUntil;
}

// Whether one controller knows of nothing that happened to the account since it was made.
bool LooksUntouched(const ComputerAccount& account, const Message& request, const std::string& ourSid,
                    bool isRecorder) {
  const std::string sid = request.Text("sid");
  if (account.created + kClockSkewSeconds < request.Number("createdAfter")) return false;
  if (sid.empty()) return LooksLeftBehind(account, request, ourSid);
  if (account.sid != sid || account.passwordSet != request.Number("passwordSet")) return false;
  if (!isRecorder) return account.lastLogon == 0;
  return account.lastLogon == request.Number("lastLogon") &&
         account.logonCount == request.Number("logonCount");
}

// Asks every controller. Throws Failure when one does not answer, for then nobody can tell.
bool IsUnused(const Message& request, Connection& connection) {
  const std::string computer = request.Text("computer");
  const std::string recorder = request.Text("recordedBy");
  const std::string ourSid = connection.directory.UserSid(connection.root, request.Text("user"));
  bool recorderAsked = request.Text("sid").empty();
  for (const std::string& controller : ControllersOf(request.Text("domain"))) {
    Directory directory(controller, kControllerTimeout);
    directory.Bind();
    const velmor::RootEntry root = directory.ReadRootEntry();
    const auto account = directory.FindComputer(root, computer);
    const bool isRecorder = UpperCase(root.controllerDnsName) == UpperCase(recorder);
    if (account && !LooksUntouched(*account, request, ourSid, isRecorder)) return false;
    recorderAsked = recorderAsked || isRecorder;
  }
  const auto account = connection.directory.FindComputer(connection.root, computer);
  return recorderAsked && account.has_value();
}

bool MayTakeOver(const Message& request, Connection& connection) {
  const std::string takeOver = request.Text("takeOver");
  if (takeOver == "any") return true;
  // A record without a time is none.
  return takeOver == "own-unused" && request.Number("createdAfter") != 0 && IsUnused(request, connection);
}

// What Provision made. When it cannot be seen the service must not take the creation for one that failed.
ComputerAccount AccountMade(Connection& connection, const std::string& computer) {
  try {
    if (const auto made = connection.directory.FindComputer(connection.root, computer)) return *made;
  } catch (const Failure& failure) {
    throw Failure(kHelperDied,
                  "the account " + computer + " was made, and cannot be read: " + failure.what());
  }
  throw Failure(kHelperDied, "the account " + computer + " was made, and is not there");
}

Message Create(const Message& request) {
  const std::string computer = request.Text("computer");
  Connection connection = Connect(request);
  const std::string container = CheckedContainer(connection, request.Text("container"));
  const bool exists = connection.directory.FindComputer(connection.root, computer).has_value();
  if (exists && !MayTakeOver(request, connection)) {
    throw Failure(kAccountExists, "there is an account " + computer + " already");
  }
  Message answer = Provision(request, connection, container, exists);
  const ComputerAccount made = AccountMade(connection, computer);
  answer.fields = {{"accountName", computer + "$"},
                   {"dn", made.dn},
                   {"sid", made.sid},
                   {"recordedBy", connection.root.controllerDnsName},
                   {"passwordSet", made.passwordSet},
                   {"lastLogon", made.lastLogon},
                   {"logonCount", made.logonCount}};
  return answer;
}

Message RemoveUnused(const Message& request) {
  const std::string computer = request.Text("computer");
  Connection connection = Connect(request);
  const auto account = connection.directory.FindComputer(connection.root, computer);
  if (!account) throw Failure(kNotFound, "there is no account " + computer);
  if (!IsUnused(request, connection)) throw Failure(kAccountInUse, "the account " + computer + " is in use");
  connection.directory.Delete(account->dn);
  return {};
}

Message Serve(const Message& request) {
  const std::string operation = request.Text("operation");
  if (operation == "domain") return TellDomain(request);
  if (operation == "create") return Create(request);
  if (operation == "remove-unused") return RemoveUnused(request);
  throw Failure(kInvalidParameter, "there is no operation '" + operation + "'");
}

}  // namespace
}  // namespace camd

int main() {
  return camd::ServeOneRequest(camd::Serve);
}
