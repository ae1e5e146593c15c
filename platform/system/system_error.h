#ifndef PLATFORM_SYSTEM_SYSTEM_ERROR_H
#define PLATFORM_SYSTEM_SYSTEM_ERROR_H

#include <string>

namespace HostMgmt::System {

/// The system's text for an error number. Safe on any thread.
std::string ErrorText(int errorNumber);

/// Throws Lib::HostMgmtException "Unable to <action> '<path>': <the system's text>".
[[noreturn]] void ThrowFileError(const char* action, const std::string& path, int errorNumber);

/// The same with a reason of our own.
[[noreturn]] void ThrowFileError(const char* action, const std::string& path, const std::string& reason);

}  // namespace HostMgmt::System

#endif
