#include "config/atomic_file_stream.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>

#include "authentication/library_exceptions.h"
#include "errors/system_text.h"

namespace quenix::authentication {

namespace {

constexpr mode_t permissionBits = 07777;

/// The first error on the way of the file's data to the disk; 0 when it is there. A file that has gone has
/// none, and it is the rename that fails.
int SyncToDisk(const std::string& path) {
  const int descriptor = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return errno == ENOENT ? 0 : errno;
  const int error = fsync(descriptor) == 0 ? 0 : errno;
  close(descriptor);
  return error;
}

void Rename(const std::string& from, const std::string& to) {
  if (rename(from.c_str(), to.c_str()) != 0) {
    const std::string reason = SystemText(errno);
    throw IOError("Unable to rename '" + from + "' to '" + to + "': " + reason);
  }
}

[[noreturn]] void ThrowPermissionError(const std::string& reason) {
  throw FilePermissionError("Failed to save file permissions, file permissions may be incorrect: " + reason);
}

}  // namespace

AtomicFileStream::AtomicFileStream(const char* path, std::ios_base::openmode mode) {
  open(path, mode);
}

AtomicFileStream::~AtomicFileStream() = default;

void AtomicFileStream::open(const char* path, std::ios_base::openmode mode) {
  std::array<char, 4096> name{};
  std::snprintf(name.data(), name.size(), "%s.XXXXXX", path);
  const int descriptor = mkstemp(name.data());
  if (descriptor < 0) {
    const std::string reason = SystemText(errno);
    throw IOError(std::string("Unable to create temporary file to write '") + path + "': " + reason);
  }
  ::close(descriptor);
  temporaryPath_ = name.data();
  targetPath_ = path;
  std::basic_ofstream<char>::open(temporaryPath_, mode | std::ios_base::out);
}

void AtomicFileStream::Commit() {
  flush();
  close();
  if (const int error = SyncToDisk(temporaryPath_); error != 0) {
    throw IOError("Unable to write '" + targetPath_ + "': " + SystemText(error));
  }

  errno = 0;
  struct stat replaced {};
  const int status = stat(targetPath_.c_str(), &replaced);
  const int statusError = errno;
  Rename(temporaryPath_, targetPath_);
  if (status != 0) {
    if (statusError != ENOENT) ThrowPermissionError(SystemText(statusError));
    return;
  }
  if (chmod(targetPath_.c_str(), replaced.st_mode & permissionBits) != 0) {
    ThrowPermissionError(SystemText(errno));
  }
}

}  // namespace quenix::authentication
