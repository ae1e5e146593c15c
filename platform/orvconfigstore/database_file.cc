#include "orvconfigstore/database_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>

#include "orvconfigstore/database_error.h"
#include "system/file_descriptor.h"
#include "system/make_directory.h"
#include "system/system_error.h"
#include "velmor/unique_fd.h"

namespace OrvConfigStore {
namespace {

using HostMgmt::System::ErrorText;
using velmor::UniqueFd;

constexpr char kDirectory[] = "/var/lib/quenix";
constexpr char kJournalPath[] = "/var/lib/quenix/configstore.db-journal";

constexpr std::uint32_t kApplicationId = 0x4f726376;  // "Orcv"
constexpr std::uint32_t kSchemaVersion = 1;

// Bytes are stored as blobs: field values are text of any bytes. The checksum covers what a whole index and
// whole pages do not prove, the values themselves.
constexpr char kSchema[] =
    "PRAGMA application_id = 0x4f726376;"
    "PRAGMA user_version = 1;"
    "CREATE TABLE object ("
    "  id INTEGER PRIMARY KEY,"
    "  namespace TEXT NOT NULL,"
    "  component TEXT NOT NULL,"
    "  grp TEXT NOT NULL,"
    "  key TEXT NOT NULL,"
    "  checksum INTEGER NOT NULL,"
    "  UNIQUE (namespace, component, grp, key));"
    "CREATE TABLE field ("
    "  object INTEGER NOT NULL REFERENCES object (id),"
    "  name TEXT NOT NULL,"
    "  value BLOB NOT NULL,"
    "  PRIMARY KEY (object, name)) WITHOUT ROWID;";

struct Closer {
  void operator()(sqlite3* connection) const { sqlite3_close(connection); }
};

struct Freer {
  void operator()(unsigned char* memory) const { sqlite3_free(memory); }
};

/// The bytes of an empty database.
std::string EmptyDatabase() {
  sqlite3* opened = nullptr;
  const int result = sqlite3_open(":memory:", &opened);
  const std::unique_ptr<sqlite3, Closer> connection(opened);
  if (result != SQLITE_OK || sqlite3_exec(opened, kSchema, nullptr, nullptr, nullptr) != SQLITE_OK) {
    ThrowDatabaseError(opened);
  }
  sqlite3_int64 size = 0;
  const std::unique_ptr<unsigned char, Freer> image(sqlite3_serialize(opened, "main", &size, 0));
  if (!image) ThrowDatabaseError(ErrorText(ENOMEM));
  return std::string(image.get(), image.get() + size);
}

[[noreturn]] void ThrowCreationError(int errorNumber) {
  ThrowDatabaseError("it cannot be created: " + ErrorText(errorNumber));
}

/// A file beside the database that holds an empty one; removed at the end. It is closed from the start: see
/// the note on locks in the header.
class ScratchFile {
 public:
  ScratchFile() : path_(std::string(kDatabasePath) + ".XXXXXX") {
    const std::string content = EmptyDatabase();
    const UniqueFd file(mkostemp(path_.data(), O_CLOEXEC));
    if (!file.IsOpen()) ThrowCreationError(errno);
    if (!HostMgmt::System::WriteAll(file.Get(), content) || fchmod(file.Get(), 0644) != 0 ||
        fsync(file.Get()) != 0) {
      const int error = errno;
      unlink(path_.c_str());
      ThrowCreationError(error);
    }
  }
  ~ScratchFile() { unlink(path_.c_str()); }
  ScratchFile(const ScratchFile&) = delete;
  ScratchFile& operator=(const ScratchFile&) = delete;

  /// Gives the file the database's name too, unless another process was first.
  void BecomeDatabase() const {
    if (link(path_.c_str(), kDatabasePath) != 0 && errno != EEXIST) ThrowCreationError(errno);
  }

 private:
  std::string path_;
};

bool IsThere(const char* path) {
  struct stat status {};
  return lstat(path, &status) == 0;
}

/// Follows links, because the database may have been moved to another place and linked to.
bool DatabaseIsThere() {
  struct stat status {};
  if (stat(kDatabasePath, &status) == 0) return true;
  if (errno != ENOENT) ThrowDatabaseError(ErrorText(errno));
  return false;
}

std::uint32_t BigEndian(const unsigned char* bytes) {
  return std::uint32_t{bytes[0]} << 24 | std::uint32_t{bytes[1]} << 16 | std::uint32_t{bytes[2]} << 8 |
         std::uint32_t{bytes[3]};
}

using Header = std::array<unsigned char, 100>;

Header ReadHeader(sqlite3* connection) {
  Header header{};
  sqlite3_file* file = nullptr;
  if (sqlite3_file_control(connection, "main", SQLITE_FCNTL_FILE_POINTER, &file) != SQLITE_OK ||
      file == nullptr || file->pMethods == nullptr) {
    ThrowDatabaseError("SQLite does not give access to it");
  }
  const int result = file->pMethods->xRead(file, header.data(), static_cast<int>(header.size()), 0);
  if (result == SQLITE_IOERR_SHORT_READ) ThrowDatabaseError("it is damaged: the end of the file is missing");
  if (result != SQLITE_OK) ThrowDatabaseError(sqlite3_errstr(result));
  return header;
}

}  // namespace

bool DatabaseExists() {
  if (DatabaseIsThere()) return true;
  if (IsThere(kDatabasePath)) ThrowDatabaseError("it is a link to a file that is not there");
  // Another process may have created the database since the first look.
  if (IsThere(kJournalPath) && !DatabaseIsThere()) {
    ThrowDatabaseError(std::string("it is gone, but its journal '") + kJournalPath + "' is there");
  }
  return DatabaseIsThere();
}

void CreateDatabaseWhenMissing() {
  if (DatabaseExists()) return;
  if (!HostMgmt::System::MakeDirectory(kDirectory)) ThrowCreationError(errno);
  ScratchFile().BecomeDatabase();
  if (!HostMgmt::System::SyncDirectory(kDirectory)) ThrowCreationError(errno);
}

void RequireOurHeader(sqlite3* connection) {
  constexpr char kMagic[16] = "SQLite format 3";
  constexpr unsigned char kRollbackJournal = 1;
  const Header header = ReadHeader(connection);
  if (std::memcmp(header.data(), kMagic, sizeof(kMagic)) != 0 ||
      BigEndian(header.data() + 68) != kApplicationId) {
    ThrowDatabaseError("it is damaged, or not a configuration store");
  }
  if (BigEndian(header.data() + 60) != kSchemaVersion) {
    ThrowDatabaseError("it is damaged, or a newer version has written it");
  }
  if (header[18] != kRollbackJournal || header[19] != kRollbackJournal) {
    ThrowDatabaseError("it is damaged, or its journal mode has been changed");
  }
}

}  // namespace OrvConfigStore
