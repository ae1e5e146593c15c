#include "hostmgmt/replace_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>
#include <vector>

#include "hostmgmt/host_management_exception.h"
#include "system/file_descriptor.h"
#include "system/resolve_links.h"
#include "system/system_error.h"

namespace HostMgmt {
namespace {

using System::FileDescriptor;

[[noreturn]] void ThrowWriteError(const std::string& path, int errorNumber) {
  System::ThrowFileError("write", path, errorNumber);
}

/// A new file beside the target; removed again unless it has taken the target's place.
class TemporaryFile {
 public:
  explicit TemporaryFile(const std::string& target)
      : path_(System::DirectoryOf(target) + "/." + target.substr(target.rfind('/') + 1) + ".XXXXXX"),
        file_(mkostemp(path_.data(), O_CLOEXEC)),
        creationError_(file_.IsOpen() ? 0 : errno) {}
  ~TemporaryFile() {
    if (file_.IsOpen() && !placed_) unlink(path_.c_str());
  }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  int GetCreationError() const { return creationError_; }
  int GetDescriptor() const { return file_.Get(); }

  /// Returns false with errno set when that fails.
  bool TakePlaceOf(const std::string& target) {
    placed_ = rename(path_.c_str(), target.c_str()) == 0;
    return placed_;
  }

 private:
  std::string path_;
  FileDescriptor file_;
  int creationError_;
  bool placed_ = false;
};

/// The names of a file's extended attributes, each ended by a null byte; none where the file system knows
/// no attributes.
std::string AttributeNames(const std::string& path) {
  for (;;) {
    const ssize_t size = listxattr(path.c_str(), nullptr, 0);
    if (size < 0 && errno == ENOTSUP) return {};
    if (size < 0) ThrowWriteError(path, errno);
    std::string names(static_cast<std::size_t>(size), '\0');
    const ssize_t got = listxattr(path.c_str(), names.data(), names.size());
    if (got < 0 && errno == ERANGE) continue;
    if (got < 0) ThrowWriteError(path, errno);
    names.resize(static_cast<std::size_t>(got));
    return names;
  }
}

void CopyAttribute(const std::string& path, const std::string& name, int descriptor) {
  for (;;) {
    const ssize_t size = getxattr(path.c_str(), name.c_str(), nullptr, 0);
    if (size < 0) ThrowWriteError(path, errno);
    std::vector<char> value(static_cast<std::size_t>(size));
    const ssize_t got = getxattr(path.c_str(), name.c_str(), value.data(), value.size());
    if (got < 0 && errno == ERANGE) continue;
    if (got < 0) ThrowWriteError(path, errno);
    if (fsetxattr(descriptor, name.c_str(), value.data(), static_cast<std::size_t>(got), 0) != 0) {
      ThrowWriteError(path, errno);
    }
    return;
  }
}

void CopyAttributes(const std::string& path, int descriptor) {
  const std::string names = AttributeNames(path);
  std::size_t start = 0;
  while (start < names.size()) {
    const std::string name = names.c_str() + start;
    CopyAttribute(path, name, descriptor);
    start += name.size() + 1;
  }
}

/// Gives the new file, once it is written, what belongs to the old one. The order matters: writing and a
/// change of owner clear mode bits and attributes, and an access list overrules the mode.
void CopyMetadata(const std::string& path, const struct stat& old, int descriptor) {
  // EINVAL: the owner is one that this user namespace does not know, so that nothing here can be his.
  if (fchown(descriptor, old.st_uid, old.st_gid) != 0 && errno != EINVAL) ThrowWriteError(path, errno);
  if (fchmod(descriptor, old.st_mode & 07777) != 0) ThrowWriteError(path, errno);
  CopyAttributes(path, descriptor);
}

bool OverwriteWith(int descriptor, const std::string& content) {
  return lseek(descriptor, 0, SEEK_SET) == 0 && System::WriteAll(descriptor, content) &&
         ftruncate(descriptor, static_cast<off_t>(content.size())) == 0 && fsync(descriptor) == 0;
}

/// Puts the old content back when the new one does not fit.
void WriteInPlace(const std::string& path, const std::string& content) {
  const FileDescriptor file(open(path.c_str(), O_RDWR | O_CLOEXEC));
  if (!file.IsOpen()) ThrowWriteError(path, errno);
  std::string oldContent;
  if (!System::ReadAll(file.Get(), &oldContent)) ThrowWriteError(path, errno);
  if (OverwriteWith(file.Get(), content)) return;
  const int error = errno;
  if (!OverwriteWith(file.Get(), oldContent)) {
    System::ThrowFileError(
        "write", path,
        System::ErrorText(error) + "; the old content could not be put back: " + System::ErrorText(errno));
  }
  ThrowWriteError(path, error);
}

/// Returns whether there is a file yet.
bool Inspect(const std::string& path, struct stat* status) {
  if (lstat(path.c_str(), status) != 0) {
    if (errno == ENOENT) return false;
    ThrowWriteError(path, errno);
  }
  if (!S_ISREG(status->st_mode)) System::ThrowFileError("write", path, "it is not a regular file");
  return true;
}

}  // namespace

void ReplaceFile(const std::string& path, const std::string& content, mode_t modeWhenNew) {
  const std::string target = System::ResolveLinks(path);
  struct stat old {};
  const bool exists = Inspect(target, &old);

  TemporaryFile temporary(target);
  // A writable file may be mounted into a directory that cannot be written.
  if (temporary.GetCreationError() == EROFS && exists) return WriteInPlace(target, content);
  if (temporary.GetCreationError() != 0) ThrowWriteError(target, temporary.GetCreationError());

  const int descriptor = temporary.GetDescriptor();
  if (!System::WriteAll(descriptor, content)) ThrowWriteError(target, errno);
  if (exists) {
    CopyMetadata(target, old, descriptor);
  } else if (fchmod(descriptor, modeWhenNew) != 0) {
    ThrowWriteError(target, errno);
  }
  if (fsync(descriptor) != 0) ThrowWriteError(target, errno);
  if (!temporary.TakePlaceOf(target)) {
    // Nothing can take the place of a mount point.
    if (errno == EBUSY && exists) return WriteInPlace(target, content);
    ThrowWriteError(target, errno);
  }
  if (!System::SyncDirectory(System::DirectoryOf(target))) ThrowWriteError(target, errno);
}

}  // namespace HostMgmt
