#ifndef PLATFORM_SYSTEM_FILE_DESCRIPTOR_H
#define PLATFORM_SYSTEM_FILE_DESCRIPTOR_H

#include <string>

namespace HostMgmt::System {

/// Writes all bytes at the descriptor's position. Returns false with errno set when that fails.
bool WriteAll(int descriptor, const std::string& content);

/// Appends all bytes from the descriptor's position on to `*content`. Returns false with errno set when that
/// fails.
bool ReadAll(int descriptor, std::string* content);

/// Makes the directory's entries durable. Returns false with errno set when that fails.
bool SyncDirectory(const std::string& path);

}  // namespace HostMgmt::System

#endif
