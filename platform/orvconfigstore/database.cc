#include "orvconfigstore/database.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <string>

#include "orvconfigstore/database_error.h"
#include "orvconfigstore/database_file.h"
#include "system/system_error.h"

namespace OrvConfigStore {
namespace {

constexpr int kLongestWaitMilliseconds = 10000;

// EXTRA makes the removal of the journal durable too: without that, a power failure could bring the journal
// back and with it undo a transaction that had been reported as done.
constexpr char kSettings[] =
    "PRAGMA synchronous = EXTRA;"
    "PRAGMA temp_store = MEMORY;"
    "PRAGMA trusted_schema = OFF;"
    "PRAGMA cell_size_check = ON;";

}  // namespace

// Opened for writing by readers too, where they may write: that lets them undo a transaction that a crash
// cut short. SQLite itself falls back to reading only, and without SQLITE_OPEN_CREATE makes no file.
Database::Database() {
  sqlite3* connection = nullptr;
  const int result = sqlite3_open_v2(kDatabasePath, &connection, SQLITE_OPEN_READWRITE, nullptr);
  connection_.reset(connection);
  if (connection == nullptr) ThrowDatabaseError(HostMgmt::System::ErrorText(ENOMEM));
  if (result != SQLITE_OK) ThrowDatabaseError(connection);
  RequireOurHeader(connection);
  sqlite3_busy_timeout(connection, kLongestWaitMilliseconds);
  Execute(kSettings);
}

std::optional<Database> Database::Open(Purpose purpose) {
  if (!DatabaseExists()) return std::nullopt;
  Database database;
  if (purpose == Purpose::kWriting) database.RequireWritable();
  database.Execute(purpose == Purpose::kWriting ? "BEGIN IMMEDIATE" : "BEGIN");
  database.RequireWhole();
  return database;
}

Statement Database::Prepare(const char* sql) const {
  return Statement(connection_.get(), sql);
}

void Database::Commit() {
  Execute("COMMIT");
}

void Database::Execute(const char* sql) const {
  if (sqlite3_exec(connection_.get(), sql, nullptr, nullptr, nullptr) != SQLITE_OK) {
    ThrowDatabaseError(connection_.get());
  }
}

void Database::RequireWritable() const {
  if (sqlite3_db_readonly(connection_.get(), "main") == 0) return;
  const int error = faccessat(AT_FDCWD, kDatabasePath, W_OK, AT_EACCESS) == 0 ? EROFS : errno;
  ThrowDatabaseError("it cannot be written: " + HostMgmt::System::ErrorText(error));
}

void Database::RequireWhole() const {
  Statement check = Prepare("PRAGMA integrity_check(1)");
  const std::string finding = check.Step() ? check.GetText(0) : "it cannot be looked through";
  if (finding != "ok") ThrowDatabaseError("it is damaged: " + finding);
}

}  // namespace OrvConfigStore
