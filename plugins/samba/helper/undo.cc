#include "helper/undo.h"

#include <string>
#include <vector>

#include "common/names.h"
#include "common/smb_conf.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/before_join.h"
#include "helper/domain_locator.h"
#include "helper/netapi.h"
#include "helper/precheck.h"
#include "helper/winbind_service.h"

namespace sambaprovider {
namespace {

constexpr const char* kStep = "undo";

// Runs one part, which says what it did; whether it worked.
template <typename Part>
bool Try(const AttemptLog& log, const Part& part) {
  try {
    log.Note(kStep, part());
    return true;
  } catch (const Failure& failure) {
    log.Note(kStep, failure.what());
    return false;
  }
}

std::string RemoveSecrets() {
  try {
    netapi::UnjoinLocally();
    return "the machine's secrets are removed";
  } catch (const Failure& failure) {
    if (failure.Code() != kNotJoined) throw;
    return "the host had no machine secrets yet";
  }
}

void ForgetMembership(State* state) {
  state->joined = false;
  state->dnsDomain.clear();
  state->netbiosDomain.clear();
  state->hostName.clear();
  state->machineAccountDn.clear();
}

// Saving the state may have reported a failure and been done all the same.
std::string ForgetJoin() {
  State state = LoadState();
  if (!state.joined) return "the domain was not remembered yet";
  ForgetMembership(&state);
  SaveState(state);
  return "the domain is forgotten";
}

// Only the one where it was made is sure to know the account; the others may, should that one have gone.
std::vector<std::string> ControllersOfAccount(const Journal& journal) {
  try {
    return ControllersInTurn({journal.accountMadeAt}, LocateControllers(journal.dnsDomain));
  } catch (const Failure&) {
    // That one is reached without the SRV records.
    return {journal.accountMadeAt};
  }
}

void RestoreService() {
  winbind_service::Stop();
  if (before_join::ServiceWasRunning()) winbind_service::Start();
}

}  // namespace

void UndoJoin(const AttemptLog& log, const Journal& journal, const UndoAccount* account) {
  log.Begin(kStep, "taking the join of " + journal.dnsDomain + " back");
  // First, since a run after a crash takes a join for whole that is remembered.
  const bool forgotten = Try(log, ForgetJoin);
  // libnetapi finds the secrets by the domain in smb.conf, so this comes before smb.conf is given back.
  if (OwnerOfPresentSmbConf() == SmbConfOwner::kProvider) Try(log, RemoveSecrets);
  if (!journal.accountMadeAt.empty() && account != nullptr) {
    Try(log, [&] {
      return RemoveAccount({journal.dnsDomain, ControllersOfAccount(journal), account->user,
                            account->password, journal.computer});
    });
  }
  const bool restored = Try(log, [] {
    before_join::GiveBack();
    return "smb.conf and the keytab are as before";
  });
  Try(log, [] {
    RestoreService();
    return before_join::ServiceWasRunning() ? "winbindd runs as before" : "winbindd is stopped as before";
  });
  const bool done = forgotten && restored;
  if (done) {
    RemoveJournal();
    before_join::DropCopies();
  }
  log.End(kStep, kSuccess, done ? "the host is as it was before" : "the rest is tried again at the next run");
}

void FinishLeave(const AttemptLog& log) {
  log.Run("configure", "giving smb.conf and the keytab back", [] {
    before_join::GiveBack();
    return "as before the join";
  });
  log.Run("state", "forgetting the domain", [] {
    State state = LoadState();
    ForgetMembership(&state);
    state.preferredDomainControllers.clear();
    SaveState(state);
    return "the host has joined no domain";
  });
  // The host has left by now; a winbindd that does not come back is told, but is no failed leave.
  try {
    log.Run("service", "putting winbindd back as it was before the join", [] {
      RestoreService();
      return before_join::ServiceWasRunning() ? "winbindd runs" : "winbindd is stopped";
    });
  } catch (const Failure&) {
    log.Note("service", "winbindd is left as it is");
  }
  RemoveJournal();
  before_join::DropCopies();
}

}  // namespace sambaprovider
