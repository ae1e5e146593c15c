// The two joins.
#include "common/files.h"
#include "common/names.h"
#include "common/paths.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/before_join.h"
#include "helper/domain_locator.h"
#include "helper/journal.h"
#include "helper/keytab.h"
#include "helper/netapi.h"
#include "helper/operations.h"
#include "helper/precheck.h"
#include "helper/preferred_controllers.h"
#include "helper/undo.h"
#include "helper/winbind_service.h"

namespace sambaprovider {
namespace {

void StopWhenCallerHasGone() {
  if (CallerHasGone()) throw Failure(kCancelled, "the calling process has ended");
}

// What needs neither network nor change. Returns the host's computer name.
std::string CheckHost() {
  if (LoadState().joined) {
    throw Failure(kAlreadyJoined, "this host has already joined " + LoadState().dnsDomain);
  }
  RequireSmbConfIsReplaceable();
  winbind_service::RequireInstalled();
  return UpperCase(HostShortName());
}

std::string CheckDomain(const std::string& text) {
  const std::string domain = LowerCase(WithoutTrailingDot(text));
  if (!IsDnsName(domain)) throw Failure(kInvalidDomainName, "'" + domain + "' cannot be a domain's name");
  return domain;
}

void CheckUser(const std::string& user) {
  if (SplitAccountName(user).user.empty()) throw Failure(kInvalidAccountName, "the user name is empty");
}

// The account of this name must be absent or ours.
void CheckAccount(const Inspection& found, const std::string& ownDnsName, const Settings& settings) {
  const bool ours = found.accountHostName.empty() || EqualWithoutCase(found.accountHostName, ownDnsName);
  if (ours || settings.reuseAccount) return;
  throw Failure(kAccountExists, found.accountDn + " belongs to " + found.accountHostName + ", not to " +
                                    ownDnsName + "; reuse-account = \"yes\" in " + paths::kSettings +
                                    " takes it over");
}

// The steps that change the host, common to both joins. What fails after Prepare() has to be undone.
class Membership {
 public:
  Membership(const Call& call, State state, Journal journal)
      : call_(call), state_(std::move(state)), journal_(std::move(journal)) {}

  // Changes nothing yet. A failure must not be undone: the copies may not be whole then.
  void Prepare() {
    before_join::PutAside();
    SaveJournal(journal_);
  }

  void Configure() {
    call_.log.Run("configure", "writing smb.conf for " + state_.netbiosDomain, [&] {
      winbind_service::Stop();
      // Samba remembers for a while which controllers did not answer, also those that do now.
      ForgetUsedControllers(state_);
      WriteSmbConf(FormatSmbConf(state_, call_.settings, KeytabUse::kDuringJoin));
      return "written";
    });
  }

  void StoreSecrets(const velmor::Secret& blob) {
    StopWhenCallerHasGone();
    call_.log.Run("secrets", "storing the machine's secrets", [&] {
      netapi::StoreSecrets(blob);
      WriteSmbConf(FormatSmbConf(state_, call_.settings, KeytabUse::kKept));
      return "stored";
    });
  }

  void CreateKeytab(const std::string& controller) {
    StopWhenCallerHasGone();
    call_.log.Run("keytab", "making the keytab", [&] {
      MakeKeytab(controller);
      return std::string("made ") + paths::kKeytab;
    });
  }

  void StartService() {
    StopWhenCallerHasGone();
    call_.log.Run("service", "starting winbindd", [] {
      winbind_service::Start();
      return "winbindd answers";
    });
  }

  // From here on the host is a member, whatever happens.
  void Finish(const std::string& machineAccountDn) {
    StopWhenCallerHasGone();
    state_.machineAccountDn = machineAccountDn;
    call_.log.Run("state", "remembering the domain", [&] {
      SaveState(state_);
      return "remembered";
    });
    RemoveJournal();
  }

 private:
  const Call& call_;
  State state_;
  Journal journal_;
};

State MemberState(const std::string& dnsDomain, const std::string& netbiosDomain,
                  const std::string& computer) {
  State state = LoadState();
  state.joined = true;
  state.dnsDomain = dnsDomain;
  state.netbiosDomain = netbiosDomain;
  state.hostName = computer;
  return state;
}

}  // namespace

std::string Join(const Call& call) {
  const std::string user = call.request.Text("user");
  std::string computer;
  std::string domain;
  call.log.Run("check", "checking names, settings and smb.conf", [&] {
    computer = CheckHost();
    domain = CheckDomain(call.request.Text("domain"));
    CheckUser(user);
    return computer + " may join";
  });
  LogonRequest logon{domain, ControllersToTry(call.log, domain, LoadState().preferredDomainControllers), user,
                     call.request.secret, computer};
  const Inspection found = Inspect(call.log, logon, call.request.Text("organizationalUnit"));
  call.log.Run("account", "looking for a computer account " + computer, [&] {
    CheckAccount(found, HostDnsName(computer, domain), call.settings);
    return found.accountDn.empty() ? "there is none" : "there is one, of this host: " + found.accountDn;
  });
  StopWhenCallerHasGone();

  // Another controller may not know the new account yet.
  logon.controllers = {found.controller};
  const Journal journal{Journal::Operation::kJoin, domain, found.netbiosDomain, computer,
                        found.accountDn.empty() ? found.controller : ""};
  Membership membership(call, MemberState(domain, found.netbiosDomain, computer), journal);
  membership.Prepare();
  try {
    membership.Configure();
    velmor::Secret blob;
    call.log.Run("provision", "making the computer account on " + found.controller, [&] {
      blob = netapi::ProvisionAccount(domain, computer, found.organizationalUnitDn, found.controller, user,
                                      call.request.secret);
      return "made";
    });
    membership.StoreSecrets(blob);
    blob = velmor::Secret();
    membership.CreateKeytab(found.controller);
    membership.StartService();
    membership.Finish(found.accountDn.empty() ? FindAccountDn(logon) : found.accountDn);
  } catch (...) {
    const UndoAccount account{user, call.request.secret};
    UndoJoin(call.log, journal, &account);
    throw;
  }
  return computer + " has joined " + domain;
}

std::string JoinWithMachineAccount(const Call& call) {
  std::string computer;
  std::string domain;
  const std::string netbiosDomain = UpperCase(call.request.Text("netbiosDomain"));
  call.log.Run("check", "checking names, settings and smb.conf", [&] {
    computer = CheckHost();
    domain = CheckDomain(call.request.Text("dnsDomain"));
    if (!IsNetbiosName(netbiosDomain)) {
      throw Failure(kInvalidDomainName, "'" + netbiosDomain + "' cannot be a domain's NetBIOS name");
    }
    if (!EqualWithoutCase(call.request.Text("accountName"), computer + "$")) {
      throw Failure(kBlobForAnotherHost,
                    "the machine account " + call.request.Text("accountName") + " is not one of " + computer);
    }
    return computer + " may join";
  });
  const Journal journal{Journal::Operation::kJoin, domain, netbiosDomain, computer, ""};
  Membership membership(call, MemberState(domain, netbiosDomain, computer), journal);
  membership.Prepare();
  try {
    membership.Configure();
    membership.StoreSecrets(call.request.secret);
    membership.StartService();
    membership.Finish("");
  } catch (...) {
    UndoJoin(call.log, journal, nullptr);
    throw;
  }
  return computer + " has joined " + domain + " with the account " + call.request.Text("accountName");
}

}  // namespace sambaprovider
