#include "orvconfigstore/statement.h"

#include "orvconfigstore/database_error.h"

namespace OrvConfigStore {

Statement::Statement(sqlite3* connection, const char* sql) : connection_(connection) {
  sqlite3_stmt* statement = nullptr;
  Check(sqlite3_prepare_v2(connection, sql, -1, &statement, nullptr));
  statement_.reset(statement);
}

Statement& Statement::BindText(const std::string& text) {
  Check(sqlite3_bind_text64(statement_.get(), ++boundParameters_, text.data(), text.size(), SQLITE_TRANSIENT,
                            SQLITE_UTF8));
  return *this;
}

Statement& Statement::BindBytes(const std::string& bytes) {
  Check(sqlite3_bind_blob64(statement_.get(), ++boundParameters_, bytes.data(), bytes.size(),
                            SQLITE_TRANSIENT));
  return *this;
}

Statement& Statement::BindInteger(std::int64_t number) {
  Check(sqlite3_bind_int64(statement_.get(), ++boundParameters_, number));
  return *this;
}

bool Statement::Step() {
  const int result = sqlite3_step(statement_.get());
  if (result != SQLITE_ROW && result != SQLITE_DONE) ThrowDatabaseError(connection_);
  return result == SQLITE_ROW;
}

std::string Statement::GetText(int column) {
  return GetContent(column, SQLITE_TEXT);
}

std::string Statement::GetBytes(int column) {
  return GetContent(column, SQLITE_BLOB);
}

std::int64_t Statement::GetInteger(int column) {
  RequireType(column, SQLITE_INTEGER);
  return sqlite3_column_int64(statement_.get(), column);
}

void Statement::Check(int result) {
  if (result != SQLITE_OK) ThrowDatabaseError(connection_);
}

void Statement::RequireType(int column, int type) {
  if (sqlite3_column_type(statement_.get(), column) != type) {
    ThrowDatabaseError("it is damaged: a value is of the wrong type");
  }
}

std::string Statement::GetContent(int column, int type) {
  RequireType(column, type);
  const void* const content = sqlite3_column_blob(statement_.get(), column);
  const int size = sqlite3_column_bytes(statement_.get(), column);
  if (content == nullptr && size > 0) ThrowDatabaseError(connection_);
  return content == nullptr ? std::string()
                            : std::string(static_cast<const char*>(content), static_cast<std::size_t>(size));
}

}  // namespace OrvConfigStore
