// The directory, asked through the helper program.
#ifndef CAMD_SERVICE_DIRECTORY_CLIENT_H
#define CAMD_SERVICE_DIRECTORY_CLIENT_H

#include <chrono>
#include <mutex>
#include <optional>
#include <string>

#include "common/message.h"
#include "common/secret.h"
#include "service/configuration.h"
#include "service/ledger.h"

namespace camd {

struct DomainInformation {
  std::string netbiosDomainName;
  std::string dnsDomainName;
  std::string domainSid;
};

struct CreatedAccount {
  GivenAccount account;
  Secret joinBlob;
};

// Every operation starts a helper, blocks for at most the configured time, and throws Failure with the status
// of docs/cam-protocol.md. Safe for use by several threads, each of which gets a helper of its own.
//
// A password that the directory refused is not tried again for five minutes, since some directories lock an
// account after a few attempts; ForgetRefusal ends that early.
class DirectoryClient {
 public:
  DomainInformation AskDomain(const DirectorySettings& settings);

  // Makes the account, or takes `known` or any other existing one over as far as the settings allow.
  CreatedAccount CreateAccount(const DirectorySettings& settings, const std::string& computer,
                               const std::string& container, const std::optional<LedgerEntry>& known);

  // Deletes the account if it still is as it was when it was given out. Throws Failure: kNotFound when it is
  // gone, kAccountInUse when it has been used or is another's.
  void RemoveUnusedAccount(const DirectorySettings& settings, const LedgerEntry& entry);

  // Also those that are still to come of what was asked before.
  void ForgetRefusal();

 private:
  Message AskHelper(const DirectorySettings& settings, const char* operation, Message request);
  void RefuseWhileLocked();

  std::mutex mutex_;
  std::optional<std::chrono::steady_clock::time_point> refused_;
  std::chrono::steady_clock::time_point forgotten_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_DIRECTORY_CLIENT_H
