#ifndef PLATFORM_ORVCONFIGSTORE_DATABASE_H
#define PLATFORM_ORVCONFIGSTORE_DATABASE_H

#include <sqlite3.h>

#include <memory>
#include <optional>

#include "orvconfigstore/statement.h"

namespace OrvConfigStore {

/// A connection to the database file with one transaction on it, used by one thread. The file has been
/// looked through for damage within the transaction. What is not committed is rolled back at the end.
/// Failures are ConfigStoreException.
///
/// The journal is a rollback journal, since the readers of a write-ahead log must be able to write.
class Database {
 public:
  enum class Purpose { kReading, kWriting };

  /// Begins a transaction. Returns nothing when there is no database. Waits at most ten seconds for another
  /// process's transaction.
  static std::optional<Database> Open(Purpose purpose);

  Statement Prepare(const char* sql) const;

  /// Ends the transaction. What it wrote is on the disk then.
  void Commit();

 private:
  struct Closer {
    void operator()(sqlite3* connection) const { sqlite3_close_v2(connection); }
  };

  Database();

  void Execute(const char* sql) const;
  void RequireWritable() const;
  void RequireWhole() const;

  std::unique_ptr<sqlite3, Closer> connection_;
};

}  // namespace OrvConfigStore

#endif
