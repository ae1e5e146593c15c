#include "hostmgmt/replace_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

#include "hostmgmt/host_management_exception.h"
#include "system/file_descriptor.h"
#include "system/resolve_links.h"
#include "system/system_error.h"
#include "velmor/unique_fd.h"

namespace HostMgmt {
namespace {

using velmor::UniqueFd;

[[noreturn]] void ThrowWriteError(const std::string& path, int errorNumber) {
  System::ThrowFileError("write", path, errorNumber);
}

/// The file that is written: the last part of `path`, looked for in the folder only.
struct Target {
  Target(int folderDescriptor, const std::string& wholePath)
      : folder(folderDescriptor), name(wholePath.substr(wholePath.rfind('/') + 1)), path(wholePath) {}

  int folder;
  std::string name;
  std::string path;
};

/// A name for a file beside the target, which nobody can guess.
std::string TemporaryName(const std::string& name) {
  constexpr std::string_view kLetters = "abcdefghijklmnopqrstuvwxyz012345";
  std::string result = "." + name + ".";
  for (int letter = 0; letter < 6; ++letter) result += kLetters[arc4random_uniform(kLetters.size())];
  return result;
}

/// A new file beside the target; removed again unless it has taken the target's place.
class TemporaryFile {
 public:
  explicit TemporaryFile(const Target& target)
      : target_(target), file_(Make()), creationError_(file_.IsOpen() ? 0 : errno) {}
  ~TemporaryFile() {
    if (file_.IsOpen() && !placed_) unlinkat(target_.folder, name_.c_str(), 0);
  }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;

  int GetCreationError() const { return creationError_; }
  int GetDescriptor() const { return file_.Get(); }

  /// Returns false with errno set when that fails.
  bool TakePlaceOfTarget() {
    placed_ = renameat(target_.folder, name_.c_str(), target_.folder, target_.name.c_str()) == 0;
    return placed_;
  }

 private:
  int Make() {
    int descriptor = -1;
    do {
      name_ = TemporaryName(target_.name);
      descriptor = openat(target_.folder, name_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    } while (descriptor < 0 && errno == EEXIST);
    return descriptor;
  }

  const Target& target_;
  std::string name_;
  UniqueFd file_;
  int creationError_;
  bool placed_ = false;
};

/// The names of a file's extended attributes, each ended by a null byte; none where the file system knows
/// no attributes.
std::string AttributeNames(const Target& target, int file) {
  for (;;) {
    const ssize_t size = flistxattr(file, nullptr, 0);
    if (size < 0 && errno == ENOTSUP) return {};
    if (size < 0) ThrowWriteError(target.path, errno);
    std::string names(static_cast<std::size_t>(size), '\0');
    const ssize_t got = flistxattr(file, names.data(), names.size());
    if (got < 0 && errno == ERANGE) continue;
    if (got < 0) ThrowWriteError(target.path, errno);
    names.resize(static_cast<std::size_t>(got));
    return names;
  }
}

void CopyAttribute(const Target& target, const std::string& name, int from, int to) {
  for (;;) {
    const ssize_t size = fgetxattr(from, name.c_str(), nullptr, 0);
    if (size < 0) ThrowWriteError(target.path, errno);
    std::vector<char> value(static_cast<std::size_t>(size));
    const ssize_t got = fgetxattr(from, name.c_str(), value.data(), value.size());
    if (got < 0 && errno == ERANGE) continue;
    if (got < 0) ThrowWriteError(target.path, errno);
    if (fsetxattr(to, name.c_str(), value.data(), static_cast<std::size_t>(got), 0) != 0) {
      ThrowWriteError(target.path, errno);
    }
    return;
  }
}

void CopyAttributes(const Target& target, int from, int to) {
  const std::string names = AttributeNames(target, from);
  std::size_t start = 0;
  while (start < names.size()) {
    const std::string name = names.c_str() + start;
    CopyAttribute(target, name, from, to);
    start += name.size() + 1;
  }
}

/// Gives the new file, once it is written, what belongs to the old one. The order matters: writing and a
/// change of owner clear mode bits and attributes, and an access list overrules the mode.
void CopyMetadata(const Target& target, int from, int to) {
  struct stat old {};
  if (fstat(from, &old) != 0) ThrowWriteError(target.path, errno);
  // EINVAL: the owner is one that this user namespace does not know, so that nothing here can be his.
  if (fchown(to, old.st_uid, old.st_gid) != 0 && errno != EINVAL) ThrowWriteError(target.path, errno);
  if (fchmod(to, old.st_mode & 07777) != 0) ThrowWriteError(target.path, errno);
  CopyAttributes(target, from, to);
}

void SetMetadata(const Target& target, const NewFileAttributes& attributes, int file) {
  if (fchown(file, attributes.owner, attributes.group) != 0 || fchmod(file, attributes.mode) != 0) {
    ThrowWriteError(target.path, errno);
  }
}

bool OverwriteWith(int descriptor, const std::string& content) {
  return lseek(descriptor, 0, SEEK_SET) == 0 && System::WriteAll(descriptor, content) &&
         ftruncate(descriptor, static_cast<off_t>(content.size())) == 0 && fsync(descriptor) == 0;
}

/// Puts the old content back when the new one does not fit.
void WriteInPlace(const Target& target, const std::string& content) {
  const UniqueFd file(
      openat(target.folder, target.name.c_str(), O_RDWR | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
  if (!file.IsOpen()) ThrowWriteError(target.path, errno);
  std::string oldContent;
  if (!System::ReadAll(file.Get(), &oldContent)) ThrowWriteError(target.path, errno);
  if (OverwriteWith(file.Get(), content)) return;
  const int error = errno;
  if (!OverwriteWith(file.Get(), oldContent)) {
    System::ThrowFileError(
        "write", target.path,
        System::ErrorText(error) + "; the old content could not be put back: " + System::ErrorText(errno));
  }
  ThrowWriteError(target.path, error);
}

/// The file as it is, for reading; not open when there is none yet.
UniqueFd OpenOld(const Target& target) {
  struct stat status {};
  if (fstatat(target.folder, target.name.c_str(), &status, AT_SYMLINK_NOFOLLOW) != 0) {
    if (errno == ENOENT) return UniqueFd();
    ThrowWriteError(target.path, errno);
  }
  if (!S_ISREG(status.st_mode)) System::ThrowFileError("write", target.path, "it is not a regular file");
  UniqueFd file(openat(target.folder, target.name.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
  if (!file.IsOpen()) ThrowWriteError(target.path, errno);
  return file;
}

}  // namespace

void ReplaceFile(const std::string& path, const std::string& content, mode_t modeWhenNew) {
  const std::string target = System::ResolveLinks(path);
  const UniqueFd folder(open(System::DirectoryOf(target).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!folder.IsOpen()) ThrowWriteError(target, errno);
  ReplaceFileIn(folder.Get(), target, content, {.mode = modeWhenNew});
}

void ReplaceFileIn(int folder, const std::string& path, const std::string& content,
                   const NewFileAttributes& whenNew) {
  const Target target(folder, path);
  const UniqueFd old = OpenOld(target);

  TemporaryFile temporary(target);
  // A writable file may be mounted into a directory that cannot be written.
  if (temporary.GetCreationError() == EROFS && old.IsOpen()) return WriteInPlace(target, content);
  if (temporary.GetCreationError() != 0) ThrowWriteError(path, temporary.GetCreationError());

  const int descriptor = temporary.GetDescriptor();
  if (!System::WriteAll(descriptor, content)) ThrowWriteError(path, errno);
  if (old.IsOpen()) {
    CopyMetadata(target, old.Get(), descriptor);
  } else {
    SetMetadata(target, whenNew, descriptor);
  }
  if (fsync(descriptor) != 0) ThrowWriteError(path, errno);
  if (!temporary.TakePlaceOfTarget()) {
    // Nothing can take the place of a mount point.
    if (errno == EBUSY && old.IsOpen()) return WriteInPlace(target, content);
    ThrowWriteError(path, errno);
  }
  if (fsync(folder) != 0) ThrowWriteError(path, errno);
}

}  // namespace HostMgmt
