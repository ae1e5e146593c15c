#ifndef PLATFORM_SYSTEM_MAKE_DIRECTORY_H
#define PLATFORM_SYSTEM_MAKE_DIRECTORY_H

#include <string>

namespace HostMgmt::System {

/// Makes the directory, readable for everybody whatever the process's umask, and its entry durable; leaves
/// one that is there as it is. Returns false with errno set when that fails.
bool MakeDirectory(const std::string& path);

}  // namespace HostMgmt::System

#endif
