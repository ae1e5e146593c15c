#include "common/names.h"
#include "common/paths.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/domain_locator.h"
#include "helper/journal.h"
#include "helper/machine_password.h"
#include "helper/netapi.h"
#include "helper/operations.h"
#include "helper/precheck.h"
#include "helper/undo.h"

namespace sambaprovider {
namespace {

// A wrong password is found out here, with its reason and with one attempt. Returns whether the directory
// still has the computer account.
bool CheckCredentials(const Call& call, const State& state, const std::string& user) {
  if (SplitAccountName(user).user.empty()) throw Failure(kInvalidAccountName, "the user name is empty");
  const auto controllers = ControllersToTry(call.log, state.dnsDomain, state.preferredDomainControllers);
  return !Inspect(call.log, {state.dnsDomain, controllers, user, call.request.secret, state.hostName}, "")
              .accountDn.empty();
}

void UnjoinWithAccount(const Call& call, const std::string& user) {
  try {
    call.log.Run("unjoin", "disabling the computer account", [&] {
      netapi::Unjoin(user, call.request.secret);
      return "the account is disabled, the machine's secrets are removed";
    });
  } catch (const Failure&) {
    // It reports an error only while the secrets are still there.
    RemoveJournal();
    throw;
  }
}

void UnjoinWithoutAccount(const Call& call, bool hasSecrets) {
  try {
    call.log.Run("unjoin", "removing the machine's secrets", [] {
      netapi::UnjoinLocally();
      return "removed; an account in the directory stays";
    });
  } catch (const Failure& failure) {
    if (failure.Code() != kNotJoined || hasSecrets) {
      RemoveJournal();
      throw Failure(kInternalError,
                    std::string("the machine's secrets stay in ") + paths::kSecrets + ": " + failure.what());
    }
    // There is nothing that a host without secrets could not leave.
    call.log.Note("unjoin", "this host has no machine secrets");
  }
}

}  // namespace

std::string Leave(const Call& call) {
  const State state = LoadState();
  const bool withAccount = call.request.fields.contains("user");
  const std::string user = call.request.Text("user");
  call.log.Run("check", "checking membership and smb.conf", [&] {
    if (!state.joined) throw Failure(kNotJoined, "this host has joined no domain");
    RequireSmbConfIsReplaceable();
    return "the host is a member of " + state.dnsDomain;
  });
  const bool disableAccount = withAccount && CheckCredentials(call, state, user);

  // libnetapi finds the secrets by the domain in smb.conf, where the distribution's may stand again.
  if (OwnerOfPresentSmbConf() != SmbConfOwner::kProvider) {
    WriteSmbConf(FormatSmbConf(state, call.settings, KeytabUse::kKept));
  }
  // Asked before libnetapi, which takes secrets that it cannot open for none.
  const bool hasSecrets = MachinePasswordTime(state.netbiosDomain).has_value();
  SaveJournal({Journal::Operation::kLeave, state.dnsDomain, state.netbiosDomain, state.hostName, ""});
  if (disableAccount) {
    UnjoinWithAccount(call, user);
  } else {
    UnjoinWithoutAccount(call, hasSecrets);
  }
  FinishLeave(call.log);
  return "the host has left " + state.dnsDomain;
}

}  // namespace sambaprovider
