#include "hostmgmt/host_management_exception.h"

namespace HostMgmt::Lib {

HostMgmtException::HostMgmtException(const std::string& text) : text_(text) {}
HostMgmtException::HostMgmtException(const HostMgmtException& other) = default;
HostMgmtException& HostMgmtException::operator=(const HostMgmtException& other) = default;
HostMgmtException::~HostMgmtException() = default;

const char* HostMgmtException::what() const noexcept {
  return text_.c_str();
}

}  // namespace HostMgmt::Lib
