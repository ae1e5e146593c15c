#ifndef ORVCONFIGSTORE_CONFIG_STORE_EXCEPTION_H
#define ORVCONFIGSTORE_CONFIG_STORE_EXCEPTION_H

#include <string>

#include "hostmgmt/export.h"
#include "hostmgmt/host_management_exception.h"

namespace OrvConfigStore {

/// The configuration store cannot do what it was asked: it is damaged, cannot be read, cannot be written,
/// or stays locked by another process. The text names the database file and the reason.
class HOSTMGMT_EXPORT ConfigStoreException : public HostMgmt::Lib::HostMgmtException {
 public:
  explicit ConfigStoreException(const std::string& text);
  ConfigStoreException(const ConfigStoreException& other);
  ConfigStoreException& operator=(const ConfigStoreException& other);
  ~ConfigStoreException() override;
};

}  // namespace OrvConfigStore

#endif
