#ifndef PLATFORM_ORVCONFIGSTORE_SQLITE_CONFIG_STORE_H
#define PLATFORM_ORVCONFIGSTORE_SQLITE_CONFIG_STORE_H

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "orvconfigstore/config_store.h"

namespace OrvConfigStore {

/// The store in its SQLite file. Holds nothing open between operations, so a store may be kept across a
/// fork and for ever.
class SqliteConfigStore : public ConfigStore {
 public:
  explicit SqliteConfigStore(const std::string& namespaceName);

  std::shared_ptr<StoreObject> GetObject(const ConfigStoreObjectId& id) override;
  bool HasObject(const ConfigStoreObjectId& id) override;
  std::vector<ConfigStoreObjectId> ListObjects(const std::string& group,
                                               const std::string& component) override;
  std::size_t CountObjects() override;
  void PutObject(std::shared_ptr<ConfigStoreObject> object, int flags) override;
  void PutObjects(const std::vector<std::shared_ptr<ConfigStoreObject>>& objects, int flags) override;
  std::string GetNamespace() const override;
  std::string GetPath() const override;
  void Verify() override;
  void RemoveObject(const ConfigStoreObjectId& id) override;
  std::size_t RemoveObjects(const std::string& group, const std::string& component) override;

 private:
  std::string namespace_;
};

}  // namespace OrvConfigStore

#endif
