/// A system file as it was read: its bytes, and what tells later whether it is still the same.
#ifndef VELMORCTL_SYSTEM_FILE_SNAPSHOT_H
#define VELMORCTL_SYSTEM_FILE_SNAPSHOT_H

#include <sys/stat.h>

#include <optional>
#include <string>

#include "file_problem.h"
#include "system_file/root_folder.h"

namespace velmorctl {

/// A file of this size is no configuration; it is refused unread.
inline constexpr std::size_t greatestSystemFile = 1 << 20;

/// Two equal identities at two times mean that nobody has changed the file between them.
struct FileIdentity {
  dev_t device = 0;
  ino_t inode = 0;
  off_t size = 0;
  timespec modified = {};
  timespec changed = {};
  mode_t mode = 0;
  uid_t owner = 0;
  gid_t group = 0;

  static FileIdentity Of(const struct stat& status);
  bool operator==(const FileIdentity& other) const;
};

struct Snapshot {
  std::string name;                      /// inside the root, for example /etc/nsswitch.conf
  std::string path;                      /// on the running system, where links have led; empty for a circle
  bool isLink = false;                   /// the name itself is a symbolic link
  std::string shown;                     /// as messages name the file: the root and the name
  std::optional<FileIdentity> identity;  /// nothing when there is no such file
  std::string content;

  bool Exists() const { return identity.has_value(); }
};

struct SnapshotInspection {
  Snapshot snapshot;
  std::optional<FileProblem> problem;  /// why the content could not be read; then it is empty
};

/// Reads the file called `name` inside the root. Never blocks on a pipe or a device, and reads no more than
/// greatestSystemFile. A problem is: no such file (Missing); a circle of links, not a regular file, not
/// readable, greater than that, changed all the time by others (Unreadable); a NUL byte or another control
/// character that no text file has (Malformed, with its line).
SnapshotInspection InspectSystemFile(const RootFolder& root, const std::string& name);

/// The same for a file that has to be there; throws the problem as a Failure: Configuration, or NeedsRoot
/// when only root may read it.
Snapshot ReadSystemFile(const RootFolder& root, const std::string& name);

/// The same for a file that may be missing: the snapshot then says so.
Snapshot ReadSystemFileIfThere(const RootFolder& root, const std::string& name);

/// Whether the file is as it was when the snapshot was taken: its name leads to the same path and the same
/// file, with the same time of its last change, owner, mode and bytes; or to the same path, where it is still
/// missing.
bool IsStillAsRead(const RootFolder& root, const Snapshot& snapshot);

}  // namespace velmorctl

#endif  // VELMORCTL_SYSTEM_FILE_SNAPSHOT_H
