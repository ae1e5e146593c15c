#include "support/files.h"

#include <fcntl.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <system_error>
#include <utility>

namespace testsupport {
namespace {

[[noreturn]] void Fail(const std::string& what) {
  throw std::system_error(errno, std::generic_category(), what);
}

/// A descriptor that closes itself. Plain calls, so that interposed stream functions are not in the way.
class Descriptor {
 public:
  Descriptor(const std::string& path, int flags, mode_t mode = 0644)
      : number_(open(path.c_str(), flags | O_CLOEXEC, mode)) {
    if (number_ < 0) {
      Fail(path);
    }
  }
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  ~Descriptor() { close(number_); }

  int Number() const { return number_; }

 private:
  int number_;
};

}  // namespace

void WriteFile(const std::string& path, const std::string& content) {
  const Descriptor file(path, O_WRONLY | O_CREAT | O_TRUNC);
  if (write(file.Number(), content.data(), content.size()) != static_cast<ssize_t>(content.size())) {
    Fail(path);
  }
}

std::string ReadFile(const std::string& path) {
  const Descriptor file(path, O_RDONLY);
  std::string content;
  char buffer[4096];
  ssize_t count = 0;
  while ((count = read(file.Number(), buffer, sizeof buffer)) > 0) {
    content.append(buffer, static_cast<std::size_t>(count));
  }
  if (count < 0) {
    Fail(path);
  }
  return content;
}

void CopyFile(const std::string& from, const std::string& to) {
  std::filesystem::copy_file(from, to, std::filesystem::copy_options::overwrite_existing);
}

void RemoveFile(const std::string& path) {
  if (unlink(path.c_str()) != 0) {
    Fail(path);
  }
}

void MakeFolders(const std::string& path) {
  std::filesystem::create_directories(path);
}

bool Exists(const std::string& path) {
  return access(path.c_str(), F_OK) == 0;
}

unsigned int ModeOf(const std::string& path) {
  struct stat status {};
  if (fstatat(AT_FDCWD, path.c_str(), &status, 0) != 0) {
    Fail(path);
  }
  return status.st_mode & 07777;
}

void SetMode(const std::string& path, unsigned int mode) {
  if (fchmodat(AT_FDCWD, path.c_str(), mode, 0) != 0) {
    Fail(path);
  }
}

std::vector<std::string> NamesIn(const std::string& folder) {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    names.push_back(entry.path().filename());
  }
  std::sort(names.begin(), names.end());
  return names;
}

ScratchFolder::ScratchFolder() : path_("/run/scratch-XXXXXX") {
  if (mkdtemp(path_.data()) == nullptr) {
    Fail(path_);
  }
  path_ += '/';
}

ScratchFolder::~ScratchFolder() {
  std::error_code ignored;
  std::filesystem::remove_all(path_, ignored);
}

SmallFileSystem::SmallFileSystem(std::string folder, std::size_t bytes) : folder_(std::move(folder)) {
  const std::string options = "mode=755,size=" + std::to_string(bytes);
  if (mount("small", folder_.c_str(), "tmpfs", 0, options.c_str()) != 0) {
    Fail(folder_);
  }
}

SmallFileSystem::~SmallFileSystem() {
  umount2(folder_.c_str(), MNT_DETACH);
}

}  // namespace testsupport
