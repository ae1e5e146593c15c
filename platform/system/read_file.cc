#include "system/read_file.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>

#include "system/file_descriptor.h"
#include "system/system_error.h"
#include "velmor/unique_fd.h"

namespace HostMgmt::System {

std::optional<std::string> ReadFile(const std::string& path) {
  // Without O_NONBLOCK, a FIFO in the file's place would hold the caller for ever.
  const velmor::UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
  if (!file.IsOpen() && errno == ENOENT) return std::nullopt;
  if (!file.IsOpen()) ThrowFileError("read", path, errno);
  struct stat status {};
  if (fstat(file.Get(), &status) != 0) ThrowFileError("read", path, errno);
  if (!S_ISREG(status.st_mode)) ThrowFileError("read", path, "it is not a regular file");
  std::string content;
  if (!ReadAll(file.Get(), &content)) ThrowFileError("read", path, errno);
  return content;
}

}  // namespace HostMgmt::System
