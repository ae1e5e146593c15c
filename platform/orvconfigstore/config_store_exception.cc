#include "orvconfigstore/config_store_exception.h"

namespace OrvConfigStore {

ConfigStoreException::ConfigStoreException(const std::string& text) : HostMgmtException(text) {}
ConfigStoreException::ConfigStoreException(const ConfigStoreException& other) = default;
ConfigStoreException& ConfigStoreException::operator=(const ConfigStoreException& other) = default;
ConfigStoreException::~ConfigStoreException() = default;

}  // namespace OrvConfigStore
