#include "system_file/snapshot.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <utility>

#include "system_file/file_calls.h"
#include "text.h"

namespace velmorctl {

namespace {

using Kind = FileProblem::Kind;

/// Another program may be writing the file in place just now; that is over soon.
constexpr int readingAttempts = 3;

bool SameTime(const timespec& left, const timespec& right) {
  return left.tv_sec == right.tv_sec && left.tv_nsec == right.tv_nsec;
}

FileProblem ProblemOf(const Snapshot& snapshot, Kind kind, const std::string& reason,
                      const std::string& remedy) {
  FileProblem problem = {};
  problem.kind = kind;
  problem.file = snapshot.shown;
  problem.reason = reason;
  problem.remedy = remedy;
  return problem;
}

FileProblem CannotRead(const Snapshot& snapshot, int errorNumber) {
  if (errorNumber == ENOENT || errorNumber == ENOTDIR) {
    return ProblemOf(
        snapshot, Kind::Missing,
        snapshot.isLink ? "it leads to '" + snapshot.path + "', which does not exist" : "it does not exist",
        "install the package that brings it again, or put a copy back");
  }
  FileProblem problem =
      ProblemOf(snapshot, Kind::Unreadable, SystemErrorText(errorNumber), "make the file readable");
  if (errorNumber == EACCES && geteuid() != 0) {
    problem.needsRoot = true;
    problem.remedy = "run the command as root";
  }
  return problem;
}

FileProblem TooGreat(const Snapshot& snapshot) {
  return ProblemOf(snapshot, Kind::Unreadable, "it has more than a mebibyte, so it is no configuration file",
                   "put the right file there");
}

/// The first byte that no text has; npos when the content is text in any encoding.
std::size_t FindBinary(const std::string& content) {
  const auto found = std::find_if(content.begin(), content.end(), [](unsigned char byte) {
    const bool isSpace = byte >= '\t' && byte <= '\r';
    return (byte < 0x20 && !isSpace) || byte == 0x7f;
  });
  return found == content.end() ? std::string::npos : static_cast<std::size_t>(found - content.begin());
}

std::optional<FileProblem> BinaryProblem(const Snapshot& snapshot) {
  const std::size_t position = FindBinary(snapshot.content);
  if (position == std::string::npos) {
    return std::nullopt;
  }
  constexpr char digits[] = "0123456789abcdef";
  const auto byte = static_cast<unsigned char>(snapshot.content[position]);
  FileProblem problem = ProblemOf(snapshot, Kind::Malformed, "it is no text file",
                                  "put a text file there, or move it away and restore a backup");
  const auto start = snapshot.content.begin();
  problem.line = 1 + static_cast<int>(std::count(start, start + static_cast<std::ptrdiff_t>(position), '\n'));
  problem.value = std::string("0x") + digits[byte >> 4U] + digits[byte & 0x0fU];
  return problem;
}

/// Reads at most one byte more than is allowed; false with errno set when that fails.
bool ReadBounded(int descriptor, std::string& content) {
  std::array<char, 16384> buffer;
  while (content.size() <= greatestSystemFile) {
    const ssize_t count = read(descriptor, buffer.data(), buffer.size());
    if (count == 0) {
      return true;
    }
    if (count > 0) {
      content.append(buffer.data(), static_cast<std::size_t>(count));
    } else if (errno != EINTR) {
      return false;
    }
  }
  return true;
}

/// Reads the open file into the snapshot. Nothing, and no identity, when it was changed meanwhile.
std::optional<FileProblem> ReadOpenFile(int descriptor, Snapshot& snapshot) {
  snapshot.identity.reset();
  snapshot.content.clear();
  struct stat before {};
  struct stat after {};
  if (fstat(descriptor, &before) != 0) {
    return CannotRead(snapshot, errno);
  }
  if (!S_ISREG(before.st_mode)) {
    return ProblemOf(snapshot, Kind::Unreadable, "it is not a regular file", "put a text file there");
  }
  if (before.st_size > static_cast<off_t>(greatestSystemFile)) {
    return TooGreat(snapshot);
  }
  if (lseek(descriptor, 0, SEEK_SET) != 0 || !ReadBounded(descriptor, snapshot.content) ||
      fstat(descriptor, &after) != 0) {
    return CannotRead(snapshot, errno);
  }
  if (snapshot.content.size() > greatestSystemFile) {
    return TooGreat(snapshot);
  }
  if (FileIdentity::Of(before) == FileIdentity::Of(after) &&
      snapshot.content.size() == static_cast<std::size_t>(after.st_size)) {
    snapshot.identity = FileIdentity::Of(after);
    return BinaryProblem(snapshot);
  }
  return std::nullopt;
}

std::optional<FileProblem> Read(Snapshot& snapshot) {
  // Without O_NONBLOCK a pipe in the file's place would hold the command up.
  const velmor::UniqueFd file(
      open(snapshot.path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOFOLLOW | O_NOCTTY));
  if (!file.IsOpen()) {
    return CannotRead(snapshot, errno);
  }
  for (int attempt = 0; attempt < readingAttempts; ++attempt) {
    std::optional<FileProblem> problem = ReadOpenFile(file.Get(), snapshot);
    if (problem || snapshot.identity) {
      return problem;
    }
  }
  return ProblemOf(snapshot, Kind::Unreadable, "it is changed while it is read", "run the command again");
}

/// Whether it is the same file with the same owner and mode. The time of its last change of status does not
/// count: the replacement of another name of a file with several hard links changes that.
bool SameFile(const FileIdentity& left, const FileIdentity& right) {
  return left.device == right.device && left.inode == right.inode &&
         SameTime(left.modified, right.modified) && left.mode == right.mode && left.owner == right.owner &&
         left.group == right.group;
}

}  // namespace

FileIdentity FileIdentity::Of(const struct stat& status) {
  return {status.st_dev,  status.st_ino,  status.st_size, status.st_mtim,
          status.st_ctim, status.st_mode, status.st_uid,  status.st_gid};
}

bool FileIdentity::operator==(const FileIdentity& other) const {
  return device == other.device && inode == other.inode && size == other.size &&
         SameTime(modified, other.modified) && SameTime(changed, other.changed) && mode == other.mode &&
         owner == other.owner && group == other.group;
}

SnapshotInspection InspectSystemFile(const RootFolder& root, const std::string& name) {
  SnapshotInspection inspection;
  Snapshot& snapshot = inspection.snapshot;
  snapshot.name = name;
  snapshot.shown = root.Shown(name);
  snapshot.isLink = root.IsLink(name);
  if (std::optional<std::string> path = root.Find(name)) {
    snapshot.path = *std::move(path);
    inspection.problem = Read(snapshot);
  } else {
    inspection.problem = ProblemOf(snapshot, Kind::Unreadable, SystemErrorText(ELOOP), circleRemedy);
  }
  if (inspection.problem) {
    snapshot.content.clear();
    snapshot.identity.reset();
  }
  return inspection;
}

Snapshot ReadSystemFile(const RootFolder& root, const std::string& name) {
  SnapshotInspection inspection = InspectSystemFile(root, name);
  if (inspection.problem) {
    throw AsFailure(*inspection.problem, ExitCode::Configuration,
                    "cannot read '" + inspection.snapshot.shown + "'");
  }
  return std::move(inspection.snapshot);
}

Snapshot ReadSystemFileIfThere(const RootFolder& root, const std::string& name) {
  SnapshotInspection inspection = InspectSystemFile(root, name);
  if (inspection.problem && inspection.problem->kind != Kind::Missing) {
    throw AsFailure(*inspection.problem, ExitCode::Configuration,
                    "cannot read '" + inspection.snapshot.shown + "'");
  }
  return std::move(inspection.snapshot);
}

bool IsStillAsRead(const RootFolder& root, const Snapshot& snapshot) {
  const SnapshotInspection now = InspectSystemFile(root, snapshot.name);
  if (!snapshot.Exists()) {
    return now.problem && now.problem->kind == Kind::Missing && now.snapshot.path == snapshot.path;
  }
  return !now.problem && now.snapshot.path == snapshot.path &&
         SameFile(*now.snapshot.identity, *snapshot.identity) && now.snapshot.content == snapshot.content;
}

}  // namespace velmorctl
