// The record of the computer accounts that the service made. It holds no secret.
#ifndef CAMD_SERVICE_LEDGER_H
#define CAMD_SERVICE_LEDGER_H

#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "service/database.h"

namespace camd {

// An account as it was when it was given out. Times of the directory are in its own unit.
struct GivenAccount {
  std::string accountName;
  std::string dn;
  std::string sid;         // empty when the service never learnt what became of its request
  std::string controller;  // the one that counted the log-ons below
  int64_t passwordSet = 0;
  int64_t lastLogon = 0;
  int64_t logonCount = 0;
  int64_t createdAfter = 0;  // seconds since 1970: when the account was first asked for
};

struct AccountRequest {
  std::string computer;
  std::string hostName;
  std::string container;
  std::string client;  // an address, or an IPv6 client's network: who shares a quota
  std::string tokenId;
};

struct LedgerEntry {
  int64_t id = 0;
  std::string computer;
  GivenAccount account;
};

// All operations may be called by any thread, block for as long as the disk takes, and throw DatabaseError.
// Times are seconds since 1970.
//
// An entry is "requested" before the directory is asked, "given" before the answer leaves, or "failed". One
// that was still "requested" when the service ended is "interrupted". Later it is "removed", or "kept" when
// the account is in use or another's.
class Ledger {
 public:
  // Opens the file, and makes it when it is absent; marks what an earlier run left unfinished as interrupted.
  explicit Ledger(const std::string& path);

  // Enters a request; returns its number, or nothing when the client has had `quota` accounts (0 for any
  // number) since the time `quotaSince`.
  std::optional<int64_t> Begin(const AccountRequest& request, int64_t now, int64_t quotaSince,
                               unsigned int quota);
  void Give(int64_t id, const GivenAccount& account, int64_t now);
  void Fail(int64_t id, uint32_t status, int64_t now);
  void Interrupt(int64_t id, int64_t now);

  // The latest account of this name that the service gave out, or may have made, and that was neither removed
  // nor seen in use. A request whose outcome is unknown does not count beside an account of the name that is
  // known, since that one may be in use.
  std::optional<LedgerEntry> FindLatest(const std::string& computer);
  // All such accounts that were asked for before a time.
  std::vector<LedgerEntry> FindOlderThan(int64_t time);
  void MarkRemoved(int64_t id, int64_t now);
  void MarkKept(int64_t id, int64_t now);

 private:
  void Mark(int64_t id, const char* state, int64_t now);

  std::mutex mutex_;
  Database database_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_LEDGER_H
