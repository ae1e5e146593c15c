#ifndef HOSTMGMT_HOST_MANAGEMENT_EXCEPTION_H
#define HOSTMGMT_HOST_MANAGEMENT_EXCEPTION_H

#include <exception>
#include <string>

#include "hostmgmt/export.h"

namespace HostMgmt::Lib {

/// A failure of the host platform: advanced options, hosts file, name resolution settings, interfaces and,
/// through its subclass, the configuration store. The text names the file or the interface and the reason.
class HOSTMGMT_EXPORT HostMgmtException : public std::exception {
 public:
  explicit HostMgmtException(const std::string& text);
  HostMgmtException(const HostMgmtException& other);
  HostMgmtException& operator=(const HostMgmtException& other);
  ~HostMgmtException() override;

  /// The text, valid as long as the exception.
  const char* what() const noexcept override;

 private:
  std::string text_;
};

}  // namespace HostMgmt::Lib

#endif
