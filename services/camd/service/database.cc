#include "service/database.h"

namespace camd {
namespace {

constexpr int kBusyMilliseconds = 10000;

}  // namespace

Database::Database(const std::string& path) : path_(path) {
  constexpr int flags = SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE | SQLITE_OPEN_NOMUTEX;
  if (sqlite3_open_v2(path.c_str(), &handle_, flags, nullptr) != SQLITE_OK) {
    const std::string reason = handle_ == nullptr ? "not enough memory" : sqlite3_errmsg(handle_);
    sqlite3_close(handle_);
    throw DatabaseError("cannot open " + path + ": " + reason);
  }
  try {
    sqlite3_busy_timeout(handle_, kBusyMilliseconds);
    Execute("PRAGMA journal_mode = WAL; PRAGMA synchronous = FULL;");
  } catch (const DatabaseError&) {
    sqlite3_close(handle_);
    throw;
  }
}

Database::~Database() {
  sqlite3_close(handle_);
}

void Database::Execute(const char* statements) {
  if (sqlite3_exec(handle_, statements, nullptr, nullptr, nullptr) != SQLITE_OK) Fail();
}

int64_t Database::LastInsertedRow() const {
  return sqlite3_last_insert_rowid(handle_);
}

int Database::ChangedRows() const {
  return sqlite3_changes(handle_);
}

void Database::Fail() const {
  throw DatabaseError(path_ + ": " + sqlite3_errmsg(handle_));
}

Statement::Statement(Database& database, std::string_view text) : database_(database) {
  if (sqlite3_prepare_v2(database.Handle(), text.data(), static_cast<int>(text.size()), &statement_,
                         nullptr) != SQLITE_OK) {
    database.Fail();
  }
}

Statement::~Statement() {
  sqlite3_finalize(statement_);
}

Statement& Statement::Bind(std::string_view text) {
  if (sqlite3_bind_text64(statement_, ++bound_, text.data(), text.size(), SQLITE_TRANSIENT, SQLITE_UTF8) !=
      SQLITE_OK) {
    database_.Fail();
  }
  return *this;
}

Statement& Statement::Bind(int64_t number) {
  if (sqlite3_bind_int64(statement_, ++bound_, number) != SQLITE_OK) database_.Fail();
  return *this;
}

bool Statement::Next() {
  const int result = sqlite3_step(statement_);
  if (result != SQLITE_ROW && result != SQLITE_DONE) database_.Fail();
  return result == SQLITE_ROW;
}

void Statement::Run() {
  Next();
}

std::string Statement::Text(int column) const {
  const unsigned char* text = sqlite3_column_text(statement_, column);
  const auto size = static_cast<size_t>(sqlite3_column_bytes(statement_, column));
  return text == nullptr ? std::string() : std::string(text, text + size);
}

int64_t Statement::Number(int column) const {
  return sqlite3_column_int64(statement_, column);
}

Transaction::Transaction(Database& database) : database_(database) {
  database_.Execute("BEGIN IMMEDIATE");
}

Transaction::~Transaction() {
  if (open_) sqlite3_exec(database_.Handle(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void Transaction::Commit() {
  database_.Execute("COMMIT");
  open_ = false;
}

}  // namespace camd
