#include "common/smb_conf.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/journal.h"
#include "helper/machine_password.h"
#include "helper/operations.h"
#include "helper/preferred_controllers.h"
#include "helper/undo.h"

namespace sambaprovider {
namespace {

void RecoverJoin(const Call& call, const Journal& journal) {
  // The state is saved as the last thing of a join, so the join was whole.
  if (LoadState().joined) {
    RemoveJournal();
    return;
  }
  const UndoAccount account{call.request.Text("user"), call.request.secret};
  const bool sameAccount = call.request.Text("operation") == "recover" && !account.user.empty();
  UndoJoin(call.log, journal, sameAccount ? &account : nullptr);
}

void RecoverLeave(const Call& call, const Journal& journal) {
  if (MachinePasswordTime(journal.netbiosDomain)) {
    // It had not got as far as removing them: the host is still a member.
    RemoveJournal();
  } else {
    FinishLeave(call.log);
  }
}

// The controllers are remembered, and the next change of them applies them. What stands in the way of that
// now must not keep the host from a leave, or from the change that mends it.
void RecoverPreference(const Call& call) {
  try {
    ApplyPreferredControllers(LoadState(), call.settings);
  } catch (const Failure& failure) {
    call.log.Note("restore", failure.what());
  }
  RemoveJournal();
}

}  // namespace

std::string Recover(const Call& call) {
  const auto journal = LoadJournal();
  if (!journal) return "nothing was interrupted";
  call.log.Run("restore", "putting right what an interrupted operation left", [&] {
    switch (journal->operation) {
      case Journal::Operation::kJoin:
        RecoverJoin(call, *journal);
        break;
      case Journal::Operation::kLeave:
        RecoverLeave(call, *journal);
        break;
      case Journal::Operation::kPrefer:
        RecoverPreference(call);
        break;
    }
    return "done";
  });
  return "an interrupted operation was put right";
}

}  // namespace sambaprovider
