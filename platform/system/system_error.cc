#include "system/system_error.h"

#include <cstring>

#include "hostmgmt/host_management_exception.h"

namespace HostMgmt::System {

std::string ErrorText(int errorNumber) {
  char buffer[256];
  return strerror_r(errorNumber, buffer, sizeof(buffer));
}

void ThrowFileError(const char* action, const std::string& path, int errorNumber) {
  ThrowFileError(action, path, ErrorText(errorNumber));
}

void ThrowFileError(const char* action, const std::string& path, const std::string& reason) {
  throw Lib::HostMgmtException(std::string("Unable to ") + action + " '" + path + "': " + reason);
}

}  // namespace HostMgmt::System
