#include "service/unused_accounts.h"

#include <syslog.h>

#include <ctime>

#include "common/status.h"

namespace camd {
namespace {

void Note(AuditLog& audit, const LedgerEntry& entry, const char* outcome, const std::string& text) {
  audit.Write(
      {{"event", "unused account"}, {"computer", entry.computer}, {"outcome", outcome}, {"text", text}});
}

// Whether a failure would meet the next account too.
bool IsOfTheWholeDirectory(uint32_t status) {
  return status == kNoLogonServers || status == kTimeout || status == kServiceLogonFailed ||
         status == kTimeSkew;
}

// False when there is no use in going on.
bool RemoveOne(const DirectorySettings& settings, const LedgerEntry& entry, Ledger& ledger,
               DirectoryClient& directory, AuditLog& audit) {
  try {
    directory.RemoveUnusedAccount(settings, entry);
    ledger.MarkRemoved(entry.id, time(nullptr));
    Note(audit, entry, "removed", "");
  } catch (const Failure& failure) {
    if (failure.Code() == kNotFound) {
      ledger.MarkRemoved(entry.id, time(nullptr));
    } else if (failure.Code() == kAccountInUse) {
      ledger.MarkKept(entry.id, time(nullptr));
    } else {
      Note(audit, entry, "not looked at", failure.what());
      return !IsOfTheWholeDirectory(failure.Code());
    }
    Note(audit, entry, "kept", failure.what());
  }
  return true;
}

}  // namespace

void RemoveUnusedAccounts(const DirectorySettings& settings, Ledger& ledger, DirectoryClient& directory,
                          AccountCreation& creation, AuditLog& audit, const std::function<bool()>& isEnding) {
  if (settings.removeUnusedAfter.count() == 0) return;
  try {
    const int64_t age = std::chrono::seconds(settings.removeUnusedAfter).count();
    for (const LedgerEntry& entry : ledger.FindOlderThan(time(nullptr) - age)) {
      if (isEnding()) return;
      const auto reservation = creation.Reserve(entry.computer);
      if (!reservation) continue;
      // Since the list was read the name may have been given out anew.
      const auto latest = ledger.FindLatest(entry.computer);
      if (!latest || latest->id != entry.id) continue;
      if (!RemoveOne(settings, entry, ledger, directory, audit)) return;
    }
  } catch (const DatabaseError& error) {
    syslog(LOG_ERR, "unused accounts were not looked for: %s", error.what());
  }
}

}  // namespace camd
