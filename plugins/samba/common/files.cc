#include "common/files.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "common/status.h"
#include "velmor/unique_fd.h"

namespace sambaprovider {
namespace {

[[noreturn]] void Fail(const char* action, const std::string& path, int error) {
  throw Failure(kInternalError, std::string("cannot ") + action + " " + path + ": " + ErrorText(error));
}

std::string FolderOf(const std::string& path) {
  return path.substr(0, path.rfind('/'));
}

void FlushFolderOf(const std::string& path) {
  const velmor::UniqueFd folder(open(FolderOf(path).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!folder.IsOpen() || fsync(folder.Get()) != 0) Fail("flush the folder of", path, errno);
}

// Nothing is open when there is no such file.
velmor::UniqueFd OpenWhenThere(const std::string& path) {
  velmor::UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.IsOpen() && errno != ENOENT) Fail("read", path, errno);
  return file;
}

std::string ReadAll(int descriptor, const std::string& path) {
  std::string content;
  char buffer[8192];
  for (;;) {
    const ssize_t count = read(descriptor, buffer, sizeof buffer);
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) Fail("read", path, errno);
    if (count == 0) return content;
    content.append(buffer, static_cast<size_t>(count));
  }
}

void WriteAll(int descriptor, std::string_view content, const std::string& path) {
  while (!content.empty()) {
    const ssize_t written = write(descriptor, content.data(), content.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) Fail("write", path, errno);
    content.remove_prefix(static_cast<size_t>(written));
  }
}

// Removes the temporary file unless it has been renamed.
class TemporaryFile {
 public:
  explicit TemporaryFile(const std::string& target) : path_(target + ".XXXXXX") {
    descriptor_ = velmor::UniqueFd(mkostemp(path_.data(), O_CLOEXEC));
    if (!descriptor_.IsOpen()) Fail("create a file beside", target, errno);
  }
  TemporaryFile(const TemporaryFile&) = delete;
  TemporaryFile& operator=(const TemporaryFile&) = delete;
  ~TemporaryFile() {
    if (!renamed_) unlink(path_.c_str());
  }

  int Descriptor() const { return descriptor_.Get(); }
  // Durably.
  void Place(const std::string& target) {
    if (fsync(descriptor_.Get()) != 0) Fail("flush", target, errno);
    if (rename(path_.c_str(), target.c_str()) != 0) Fail("replace", target, errno);
    renamed_ = true;
    FlushFolderOf(target);
  }

 private:
  std::string path_;
  velmor::UniqueFd descriptor_;
  bool renamed_ = false;
};

}  // namespace

std::string ErrorText(int error) {
  char buffer[128] = "";
  return strerror_r(error, buffer, sizeof buffer);
}

std::optional<std::string> ReadFile(const std::string& path) {
  const velmor::UniqueFd file = OpenWhenThere(path);
  if (!file.IsOpen()) return std::nullopt;
  return ReadAll(file.Get(), path);
}

void ReplaceFile(const std::string& path, std::string_view content, mode_t mode) {
  TemporaryFile temporary(path);
  WriteAll(temporary.Descriptor(), content, path);
  if (fchmod(temporary.Descriptor(), mode) != 0) Fail("set the mode of", path, errno);
  temporary.Place(path);
}

bool CopyFile(const std::string& from, const std::string& to) {
  const velmor::UniqueFd file = OpenWhenThere(from);
  if (!file.IsOpen()) return false;
  struct stat original = {};
  if (fstat(file.Get(), &original) != 0) Fail("read", from, errno);
  TemporaryFile temporary(to);
  WriteAll(temporary.Descriptor(), ReadAll(file.Get(), from), to);
  // The mode comes last, since a change of owner takes some of its bits away.
  // EINVAL: the owner is one that this user namespace does not know, so that nothing here can be his.
  if (fchown(temporary.Descriptor(), original.st_uid, original.st_gid) != 0 && errno != EINVAL)
    Fail("set the owner of", to, errno);
  if (fchmod(temporary.Descriptor(), original.st_mode & 07777) != 0) Fail("set the mode of", to, errno);
  temporary.Place(to);
  return true;
}

std::string FileBehindLinks(const std::string& path) {
  std::error_code error;
  const std::filesystem::path file = std::filesystem::canonical(path, error);
  return error ? path : file.string();
}

void RemoveFile(const std::string& path) {
  if (unlink(path.c_str()) == 0) {
    FlushFolderOf(path);
  } else if (errno != ENOENT) {
    Fail("remove", path, errno);
  }
}

void MakeFolder(const std::string& path, mode_t mode) {
  if (mkdir(path.c_str(), mode) == 0) {
    if (chmod(path.c_str(), mode) != 0) Fail("set the mode of", path, errno);
    FlushFolderOf(path);
  } else if (errno != EEXIST) {
    Fail("make the folder", path, errno);
  }
}

void RemoveFolder(const std::string& path) {
  std::error_code error;
  std::filesystem::remove_all(path, error);
  if (error) Fail("remove", path, error.value());
}

bool FileExists(const std::string& path) {
  return access(path.c_str(), F_OK) == 0;
}

bool IsLink(const std::string& path) {
  std::error_code error;
  return std::filesystem::is_symlink(path, error);
}

}  // namespace sambaprovider
