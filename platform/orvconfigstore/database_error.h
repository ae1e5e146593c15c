#ifndef PLATFORM_ORVCONFIGSTORE_DATABASE_ERROR_H
#define PLATFORM_ORVCONFIGSTORE_DATABASE_ERROR_H

#include <sqlite3.h>

#include <string>

namespace OrvConfigStore {

/// Throws ConfigStoreException "The configuration store '<the database file>' cannot be used: <reason>".
[[noreturn]] void ThrowDatabaseError(const std::string& reason);

/// The same with the reason of the connection's last failure.
[[noreturn]] void ThrowDatabaseError(sqlite3* connection);

}  // namespace OrvConfigStore

#endif
