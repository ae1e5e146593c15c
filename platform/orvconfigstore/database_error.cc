#include "orvconfigstore/database_error.h"

#include "orvconfigstore/config_store_exception.h"
#include "orvconfigstore/database_file.h"
#include "system/system_error.h"

namespace OrvConfigStore {

void ThrowDatabaseError(const std::string& reason) {
  throw ConfigStoreException(std::string("The configuration store '") + kDatabasePath +
                             "' cannot be used: " + reason);
}

void ThrowDatabaseError(sqlite3* connection) {
  const int code = sqlite3_extended_errcode(connection);
  if (code == SQLITE_READONLY_ROLLBACK) {
    ThrowDatabaseError("a change was cut short by a crash, and undoing it takes the right to write the file");
  }
  if (code == SQLITE_READONLY_DIRECTORY) {
    ThrowDatabaseError("it cannot be written: its directory takes no journal");
  }
  if ((code & 0xff) == SQLITE_BUSY) ThrowDatabaseError("another process has held it for ten seconds");
  const int systemError = sqlite3_system_errno(connection);
  const bool isSystemFailure =
      (code & 0xff) == SQLITE_CANTOPEN || (code & 0xff) == SQLITE_IOERR || (code & 0xff) == SQLITE_FULL;
  std::string reason = sqlite3_errmsg(connection);
  if (isSystemFailure && systemError != 0) reason += " (" + HostMgmt::System::ErrorText(systemError) + ")";
  ThrowDatabaseError(reason);
}

}  // namespace OrvConfigStore
