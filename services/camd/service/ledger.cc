#include "service/ledger.h"

namespace camd {
namespace {

constexpr const char* kSchema = R"(
  CREATE TABLE IF NOT EXISTS accounts (
    id INTEGER PRIMARY KEY,
    computer TEXT NOT NULL,
    hostName TEXT NOT NULL,
    container TEXT NOT NULL,
    client TEXT NOT NULL,
    tokenId TEXT NOT NULL,
    state TEXT NOT NULL,
    requested INTEGER NOT NULL,
    changed INTEGER NOT NULL,
    status INTEGER NOT NULL DEFAULT 0,
    accountName TEXT NOT NULL DEFAULT '',
    dn TEXT NOT NULL DEFAULT '',
    sid TEXT NOT NULL DEFAULT '',
    controller TEXT NOT NULL DEFAULT '',
    passwordSet INTEGER NOT NULL DEFAULT 0,
    lastLogon INTEGER NOT NULL DEFAULT 0,
    logonCount INTEGER NOT NULL DEFAULT 0);
  CREATE INDEX IF NOT EXISTS accountsByComputer ON accounts (computer, id);
  CREATE INDEX IF NOT EXISTS accountsByClient ON accounts (client, requested);
)";

// An account that was taken over was first asked for when the entry of the same identifier was, or the one
// whose outcome nobody learnt. That one says nothing of an account that another entry knows.
constexpr const char* kColumns = R"(
  SELECT id, computer, accountName, dn, sid, controller, passwordSet, lastLogon, logonCount,
    (SELECT min(first.requested) FROM accounts AS first
      WHERE first.id = accounts.id
        OR (accounts.sid <> '' AND first.sid = accounts.sid)
        OR (accounts.sid <> '' AND first.computer = accounts.computer AND first.state = 'interrupted'))
  FROM accounts
  WHERE (state = 'given'
      OR (state = 'interrupted'
        AND NOT EXISTS (SELECT 1 FROM accounts AS known
          WHERE known.computer = accounts.computer AND known.sid <> '' AND known.state IN ('given', 'kept'))))
)";

LedgerEntry EntryOf(const Statement& row) {
  LedgerEntry entry;
  entry.id = row.Number(0);
  entry.computer = row.Text(1);
  entry.account = {row.Text(2),   row.Text(3),   row.Text(4),   row.Text(5),
                   row.Number(6), row.Number(7), row.Number(8), row.Number(9)};
  return entry;
}

}  // namespace

Ledger::Ledger(const std::string& path) : database_(path) {
  database_.Execute(kSchema);
  database_.Execute("UPDATE accounts SET state = 'interrupted' WHERE state = 'requested'");
}

std::optional<int64_t> Ledger::Begin(const AccountRequest& request, int64_t now, int64_t quotaSince,
                                     unsigned int quota) {
  const std::lock_guard lock(mutex_);
  Transaction transaction(database_);
  if (quota != 0) {
    Statement count(database_,
                    "SELECT count(*) FROM accounts WHERE client = ? AND requested > ? AND state <> 'failed'");
    count.Bind(request.client).Bind(quotaSince).Next();
    if (count.Number(0) >= quota) return std::nullopt;
  }
  Statement(
      database_,
      "INSERT INTO accounts (computer, hostName, container, client, tokenId, state, requested, changed) "
      "VALUES (?, ?, ?, ?, ?, 'requested', ?, ?)")
      .Bind(request.computer)
      .Bind(request.hostName)
      .Bind(request.container)
      .Bind(request.client)
      .Bind(request.tokenId)
      .Bind(now)
      .Bind(now)
      .Run();
  const int64_t id = database_.LastInsertedRow();
  transaction.Commit();
  return id;
}

void Ledger::Give(int64_t id, const GivenAccount& account, int64_t now) {
  const std::lock_guard lock(mutex_);
  Transaction transaction(database_);
  // Earlier entries of the same account must not be looked at any more: they know an older password.
  Statement(database_, "UPDATE accounts SET state = 'kept' WHERE sid = ? AND state = 'given'")
      .Bind(account.sid)
      .Run();
  Statement(
      database_,
      "UPDATE accounts SET state = 'given', changed = ?, accountName = ?, dn = ?, sid = ?, controller = ?, "
      "passwordSet = ?, lastLogon = ?, logonCount = ? WHERE id = ?")
      .Bind(now)
      .Bind(account.accountName)
      .Bind(account.dn)
      .Bind(account.sid)
      .Bind(account.controller)
      .Bind(account.passwordSet)
      .Bind(account.lastLogon)
      .Bind(account.logonCount)
      .Bind(id)
      .Run();
  transaction.Commit();
}

void Ledger::Fail(int64_t id, uint32_t status, int64_t now) {
  const std::lock_guard lock(mutex_);
  Statement(database_, "UPDATE accounts SET state = 'failed', status = ?, changed = ? WHERE id = ?")
      .Bind(int64_t{status})
      .Bind(now)
      .Bind(id)
      .Run();
}

void Ledger::Interrupt(int64_t id, int64_t now) {
  Mark(id, "interrupted", now);
}

std::optional<LedgerEntry> Ledger::FindLatest(const std::string& computer) {
  const std::lock_guard lock(mutex_);
  Statement rows(database_, std::string(kColumns) + "AND computer = ? ORDER BY id DESC LIMIT 1");
  if (!rows.Bind(computer).Next()) return std::nullopt;
  return EntryOf(rows);
}

std::vector<LedgerEntry> Ledger::FindOlderThan(int64_t time) {
  const std::lock_guard lock(mutex_);
  Statement rows(database_, std::string(kColumns) + "AND requested < ? ORDER BY id");
  rows.Bind(time);
  std::vector<LedgerEntry> entries;
  while (rows.Next()) entries.push_back(EntryOf(rows));
  return entries;
}

void Ledger::MarkRemoved(int64_t id, int64_t now) {
  Mark(id, "removed", now);
}

void Ledger::MarkKept(int64_t id, int64_t now) {
  Mark(id, "kept", now);
}

void Ledger::Mark(int64_t id, const char* state, int64_t now) {
  const std::lock_guard lock(mutex_);
  Statement(database_, "UPDATE accounts SET state = ?, changed = ? WHERE id = ?")
      .Bind(std::string_view(state))
      .Bind(now)
      .Bind(id)
      .Run();
}

}  // namespace camd
