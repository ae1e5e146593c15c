// A SQLite database and its statements.
#ifndef CAMD_SERVICE_DATABASE_H
#define CAMD_SERVICE_DATABASE_H

#include <sqlite3.h>

#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>

namespace camd {

// A database that cannot be used; the text names the file and the reason.
class DatabaseError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// A connection to a database file, which is made when it is absent. Nothing else of the process may open and
// close the file, since that would take the locks of this connection away. Every committed change is on the
// disk. Waits up to ten seconds for another process. All operations throw DatabaseError. For one thread at a
// time.
class Database {
 public:
  explicit Database(const std::string& path);
  Database(const Database&) = delete;
  Database& operator=(const Database&) = delete;
  ~Database();

  // Runs statements without parameters and results.
  void Execute(const char* statements);
  int64_t LastInsertedRow() const;
  int ChangedRows() const;

  sqlite3* Handle() const { return handle_; }
  [[noreturn]] void Fail() const;

 private:
  std::string path_;
  sqlite3* handle_ = nullptr;
};

// One prepared statement; parameters are bound in their order. Must end before its database.
class Statement {
 public:
  Statement(Database& database, std::string_view text);
  Statement(const Statement&) = delete;
  Statement& operator=(const Statement&) = delete;
  ~Statement();

  Statement& Bind(std::string_view text);
  Statement& Bind(int64_t number);

  // Steps to the next row; false when there is none.
  bool Next();
  // Runs a statement that gives no rows.
  void Run();

  std::string Text(int column) const;
  int64_t Number(int column) const;

 private:
  Database& database_;
  sqlite3_stmt* statement_ = nullptr;
  int bound_ = 0;
};

// A transaction that is undone unless Commit is called.
class Transaction {
 public:
  explicit Transaction(Database& database);
  Transaction(const Transaction&) = delete;
  Transaction& operator=(const Transaction&) = delete;
  ~Transaction();

  void Commit();

 private:
  Database& database_;
  bool open_ = true;
};

}  // namespace camd

#endif  // CAMD_SERVICE_DATABASE_H
