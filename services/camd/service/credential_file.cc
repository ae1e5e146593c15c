#include "service/credential_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>

#include "common/status.h"
#include "common/unique_fd.h"

namespace camd {
namespace {

constexpr off_t kLongestFile = 1024 * 1024;

bool IsHandedOver(const std::string& name) {
  return name.find('/') == std::string::npos;
}

const char* FolderOfCredentials() {
  return std::getenv("CREDENTIALS_DIRECTORY");
}

// The path that a name stands for.
std::string PathOf(const std::string& name) {
  if (!IsHandedOver(name)) return name;
  const char* folder = FolderOfCredentials();
  if (folder == nullptr) throw Failure(kInternalError, "systemd handed over no credential '" + name + "'");
  return std::string(folder) + "/" + name;
}

// A file that is open for reading, and what is known of it.
struct OpenFile {
  std::string path;
  UniqueFd descriptor;
  struct stat status = {};
};

OpenFile Open(const std::string& name) {
  OpenFile file;
  file.path = PathOf(name);
  file.descriptor = UniqueFd(open(file.path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
  if (!file.descriptor.IsOpen() || fstat(file.descriptor.Get(), &file.status) != 0) {
    throw Failure(kInternalError, "cannot open " + file.path + ": " + ErrorText(errno));
  }
  if (!S_ISREG(file.status.st_mode)) throw Failure(kInternalError, file.path + " is no plain file");
  if (file.status.st_size > kLongestFile) throw Failure(kInternalError, file.path + " is too long");
  return file;
}

void CheckOwnersOnly(const OpenFile& file, bool handedOver) {
  // systemd guards the folder of its credentials, and may give the reader an entry in an access list, which
  // shows as a right of the group.
  const mode_t forbidden = handedOver ? S_IRWXO : S_IRWXG | S_IRWXO;
  if ((file.status.st_mode & forbidden) != 0) {
    throw Failure(kInternalError,
                  file.path + " is open to others than its owner; its mode must be 0600 or 0400");
  }
  if (file.status.st_uid != geteuid() && file.status.st_uid != 0) {
    throw Failure(kInternalError, file.path + " belongs to another user");
  }
}

Secret Read(const OpenFile& file) {
  Secret secret(static_cast<size_t>(file.status.st_size));
  size_t done = 0;
  while (done < secret.Size()) {
    const ssize_t count = read(file.descriptor.Get(), secret.Data() + done, secret.Size() - done);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) break;
    done += static_cast<size_t>(count);
  }
  while (done > 0 && (secret.Text()[done - 1] == '\n' || secret.Text()[done - 1] == '\r')) --done;
  secret.Shorten(done);
  if (done == 0) throw Failure(kInternalError, file.path + " is empty");
  return secret;
}

}  // namespace

Secret ReadCredentialFile(const std::string& name) {
  const OpenFile file = Open(name);
  CheckOwnersOnly(file, IsHandedOver(name));
  return Read(file);
}

bool IsOutOfReach(const std::string& name) {
  return IsHandedOver(name) && FolderOfCredentials() == nullptr;
}

Secret ReadPublicFile(const std::string& name) {
  return Read(Open(name));
}

}  // namespace camd
