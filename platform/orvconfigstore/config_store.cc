#include "orvconfigstore/config_store.h"

#include "orvconfigstore/sqlite_config_store.h"

namespace OrvConfigStore {

ConfigStore::ConfigStore() = default;
ConfigStore::~ConfigStore() = default;

std::shared_ptr<ConfigStore> ConfigStore::GetStore(const std::string& namespaceName) {
  if (namespaceName.empty()) throw ConfigStoreException("A configuration store needs a namespace");
  return std::make_shared<SqliteConfigStore>(namespaceName);
}

}  // namespace OrvConfigStore
