// Removal of accounts that were given out and never used.
#ifndef CAMD_SERVICE_UNUSED_ACCOUNTS_H
#define CAMD_SERVICE_UNUSED_ACCOUNTS_H

#include <functional>

#include "service/account_creation.h"
#include "service/audit_log.h"
#include "service/configuration.h"
#include "service/directory_client.h"
#include "service/ledger.h"

namespace camd {

// Looks at all accounts of the ledger that are older than the settings say, has those removed that were never
// used, and enters what became of each. One that the directory cannot tell about, and one whose name is just
// asked for, stays for the next time. Once `isEnding` says so, no further account is looked at. Blocks for as
// long as the directory takes. A fault of the ledger goes to the system log.
void RemoveUnusedAccounts(const DirectorySettings& settings, Ledger& ledger, DirectoryClient& directory,
                          AccountCreation& creation, AuditLog& audit, const std::function<bool()>& isEnding);

}  // namespace camd

#endif  // CAMD_SERVICE_UNUSED_ACCOUNTS_H
