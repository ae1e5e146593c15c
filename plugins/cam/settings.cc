#include "settings.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

#include "failure.h"
#include "settings_parser.h"

namespace camproxy {

namespace {

constexpr std::size_t LARGEST_FILE = 64 * 1024;

[[noreturn]] void Refuse(const std::string& fault) {
  throw Failure(SETTINGS_FAULT, std::string(SETTINGS_FILE) + " " + fault);
}

[[noreturn]] void RefuseForError(int error) {
  Refuse("cannot be read: " + std::generic_category().message(error));
}

class SettingsFile {
 public:
  /// Opens the file; without waiting, should it be a pipe.
  SettingsFile() : descriptor_(open(SETTINGS_FILE, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {
    if (descriptor_ < 0 && errno != ENOENT) RefuseForError(errno);
    if (descriptor_ >= 0 && fstat(descriptor_, &status_) != 0) RefuseForError(errno);
  }
  SettingsFile(const SettingsFile&) = delete;
  SettingsFile& operator=(const SettingsFile&) = delete;
  ~SettingsFile() {
    if (descriptor_ >= 0) close(descriptor_);
  }

  bool Exists() const { return descriptor_ >= 0; }
  bool OthersCanRead() const { return (status_.st_mode & (S_IRGRP | S_IROTH)) != 0; }

  /// What the file says decides whom the host trusts, so nobody else may have a hand in it.
  void CheckOwner() const {
    if (!S_ISREG(status_.st_mode)) Refuse("is no regular file");
    if (status_.st_uid != 0 && status_.st_uid != geteuid()) Refuse("belongs to another user than root");
    if ((status_.st_mode & (S_IWGRP | S_IWOTH)) != 0) Refuse("can be written by others than its owner");
  }

  SecretString Read() const {
    SecretString content(LARGEST_FILE, '\0');
    std::size_t length = 0;
    while (length < content.size()) {
      const ssize_t count = read(descriptor_, content.data() + length, content.size() - length);
      if (count == 0) break;
      if (count < 0 && errno != EINTR) RefuseForError(errno);
      if (count > 0) length += static_cast<std::size_t>(count);
    }
    if (length == content.size()) Refuse("is too long");
    content.resize(length);
    return content;
  }

 private:
  int descriptor_;
  struct stat status_ {};
};

}  // namespace

std::optional<Sha256> Settings::Sha256For(const std::string& server) const {
  const auto own = sha256OfServer.find(server);
  return own != sha256OfServer.end() ? own->second : sha256;
}

Settings LoadSettings() {
  const SettingsFile file;
  if (!file.Exists()) return {};
  file.CheckOwner();
  Settings settings = ParseSettings(file.Read());
  if (!settings.token.empty() && file.OthersCanRead()) {
    Refuse("holds a token and can be read by others than its owner");
  }
  return settings;
}

}  // namespace camproxy
