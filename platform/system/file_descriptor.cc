#include "system/file_descriptor.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstddef>

#include "velmor/unique_fd.h"

namespace HostMgmt::System {

bool WriteAll(int descriptor, const std::string& content) {
  std::size_t done = 0;
  while (done < content.size()) {
    const ssize_t written = write(descriptor, content.data() + done, content.size() - done);
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return false;
    done += static_cast<std::size_t>(written);
  }
  return true;
}

bool ReadAll(int descriptor, std::string* content) {
  char buffer[16384];
  for (;;) {
    const ssize_t got = read(descriptor, buffer, sizeof(buffer));
    if (got < 0 && errno == EINTR) continue;
    if (got < 0) return false;
    if (got == 0) return true;
    content->append(buffer, static_cast<std::size_t>(got));
  }
}

bool SyncDirectory(const std::string& path) {
  const velmor::UniqueFd directory(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  return directory.IsOpen() && fsync(directory.Get()) == 0;
}

}  // namespace HostMgmt::System
