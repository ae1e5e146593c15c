#ifndef PLATFORM_SYSTEM_READ_FILE_H
#define PLATFORM_SYSTEM_READ_FILE_H

#include <optional>
#include <string>

namespace HostMgmt::System {

/// The whole content of the file, or nothing when there is no such file. Throws Lib::HostMgmtException
/// "Unable to read '<path>': <reason>" for every other failure, and for what is not a regular file.
std::optional<std::string> ReadFile(const std::string& path);

}  // namespace HostMgmt::System

#endif
