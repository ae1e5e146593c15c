#include "common/names.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/domain_locator.h"
#include "helper/journal.h"
#include "helper/netapi.h"
#include "helper/operations.h"
#include "helper/precheck.h"
#include "helper/undo.h"

namespace sambaprovider {
namespace {

// A wrong password is found out here, with its reason and with one attempt.
void CheckCredentials(const Call& call, const State& state, const std::string& user) {
  if (SplitAccountName(user).user.empty()) throw Failure(kInvalidAccountName, "the user name is empty");
  std::vector<std::string> controllers = state.preferredDomainControllers;
  call.log.Run("locate", "asking DNS for the controllers of " + state.dnsDomain, [&] {
    const std::vector<std::string> found = LocateControllers(state.dnsDomain);
    controllers.insert(controllers.end(), found.begin(), found.end());
    return std::to_string(found.size()) + " known";
  });
  Inspect(call.log, {state.dnsDomain, controllers, user, call.request.secret, state.hostName}, "");
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
  if (withAccount) CheckCredentials(call, state, user);

  SaveJournal({Journal::Operation::kLeave, state.dnsDomain, state.netbiosDomain, state.hostName, false});
  try {
    call.log.Run("unjoin", withAccount ? "disabling the computer account" : "removing the machine's secrets",
                 [&] {
                   if (withAccount) {
                     netapi::Unjoin(user, call.request.secret);
                     return "the account is disabled, the machine's secrets are removed";
                   }
                   netapi::UnjoinLocally();
                   return "removed; the account in the directory stays";
                 });
  } catch (const Failure&) {
    // It reports an error only while the secrets are still there.
    if (withAccount) {
      RemoveJournal();
      throw;
    }
    call.log.Note("unjoin", "this host has no machine secrets");
  }
  FinishLeave(call.log);
  return "the host has left " + state.dnsDomain;
}

}  // namespace sambaprovider
