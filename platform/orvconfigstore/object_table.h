#ifndef PLATFORM_ORVCONFIGSTORE_OBJECT_TABLE_H
#define PLATFORM_ORVCONFIGSTORE_OBJECT_TABLE_H

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "orvconfigstore/database.h"
#include "orvconfigstore/store_object.h"

namespace OrvConfigStore {

/// The objects of one namespace within an open transaction. Failures are ConfigStoreException.
class ObjectTable {
 public:
  /// Keeps a reference to the database.
  ObjectTable(const Database& database, const std::string& namespaceName);

  /// The object, or an empty reference. Throws when it is not as it was written.
  std::shared_ptr<ConfigStoreObject> Find(const ConfigStoreObjectId& id) const;

  std::vector<ConfigStoreObjectId> List(const std::string& group, const std::string& component) const;
  std::vector<ConfigStoreObjectId> ListAll() const;
  std::size_t Count() const;

  void Replace(const ConfigStoreObject& object) const;
  void Remove(const ConfigStoreObjectId& id) const;

 private:
  Statement PrepareFor(const char* sql, const ConfigStoreObjectId& id) const;

  const Database& database_;
  std::string namespace_;
};

}  // namespace OrvConfigStore

#endif
