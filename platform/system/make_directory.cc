#include "system/make_directory.h"

#include <sys/stat.h>

#include <cerrno>

#include "system/file_descriptor.h"
#include "system/resolve_links.h"

namespace HostMgmt::System {

bool MakeDirectory(const std::string& path) {
  if (mkdir(path.c_str(), 0755) != 0) return errno == EEXIST;
  return chmod(path.c_str(), 0755) == 0 && SyncDirectory(DirectoryOf(path));
}

}  // namespace HostMgmt::System
