#ifndef PLATFORM_ORVCONFIGSTORE_DATABASE_FILE_H
#define PLATFORM_ORVCONFIGSTORE_DATABASE_FILE_H

#include <sqlite3.h>

namespace OrvConfigStore {

constexpr char kDatabasePath[] = "/var/lib/quenix/configstore.db";

// The file is looked at through SQLite only: closing any descriptor of it would drop the locks that other
// threads of this process hold through SQLite.

/// Tells whether there is a database, whatever its state. Throws ConfigStoreException when that cannot be
/// known, or when only a part of a database is there.
bool DatabaseExists();

/// Puts an empty database, readable for everybody, in place when there is none. The file appears whole, so
/// that a short one is always a damaged one. Several processes may do it at once. Throws
/// ConfigStoreException.
void CreateDatabaseWhenMissing();

/// Looks at the header of the file before SQLite uses it: throws ConfigStoreException for a file that is not
/// a database of ours, or that a newer version has written.
void RequireOurHeader(sqlite3* connection);

}  // namespace OrvConfigStore

#endif
