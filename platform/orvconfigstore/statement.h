#ifndef PLATFORM_ORVCONFIGSTORE_STATEMENT_H
#define PLATFORM_ORVCONFIGSTORE_STATEMENT_H

#include <sqlite3.h>

#include <cstdint>
#include <memory>
#include <string>

namespace OrvConfigStore {

/// One SQL statement, with parameters that are bound one after the other. It ends before its connection.
/// Failures are ConfigStoreException.
class Statement {
 public:
  Statement(sqlite3* connection, const char* sql);

  Statement& BindText(const std::string& text);
  Statement& BindBytes(const std::string& bytes);
  Statement& BindInteger(std::int64_t number);

  /// Takes one step. Returns whether there is a row.
  bool Step();

  /// A column of the present row. A column of another type is damage.
  std::string GetText(int column);
  std::string GetBytes(int column);
  std::int64_t GetInteger(int column);

 private:
  struct Finalizer {
    void operator()(sqlite3_stmt* statement) const { sqlite3_finalize(statement); }
  };

  void Check(int result);
  void RequireType(int column, int type);
  std::string GetContent(int column, int type);

  sqlite3* connection_;
  std::unique_ptr<sqlite3_stmt, Finalizer> statement_;
  int boundParameters_ = 0;
};

}  // namespace OrvConfigStore

#endif
