#ifndef ORVCONFIGSTORE_CONFIG_STORE_H
#define ORVCONFIGSTORE_CONFIG_STORE_H

#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include "hostmgmt/export.h"
#include "orvconfigstore/config_store_exception.h"
#include "orvconfigstore/store_object.h"

namespace OrvConfigStore {

/// The namespace that the whole host shares. A plain array, so that it can be used while other static
/// objects are being constructed.
constexpr char sGlobalNamespace[] = "global";

/// The host's configuration store: objects with text fields, kept in /var/lib/quenix/configstore.db until
/// they are removed, through restarts and crashes. What an operation that changes the store has returned
/// from is on the disk.
///
/// Thread- and process-safe: each operation is one transaction, which sees and leaves a whole store. An
/// operation that meets another process's transaction waits for it, at most ten seconds, and then throws.
///
/// Reading needs no privilege, and a host without a database has an empty store. Reading never creates a
/// file. A database that is damaged is never used in part, repaired or replaced: every operation throws
/// until it has been put back by hand.
///
/// Every operation throws ConfigStoreException, with the file's path and the reason, when the database is
/// damaged, cannot be read or (for those that change it) written, or stays locked.
///
/// The order of the virtual operations is part of the binary interface: GetObject is the first, PutObject
/// the fifth, RemoveObject the tenth, and the destructor comes after all of them.
class HOSTMGMT_EXPORT ConfigStore {
 public:
  ConfigStore(const ConfigStore&) = delete;
  ConfigStore& operator=(const ConfigStore&) = delete;

  /// The store of the given namespace. Cheap: opens no file, so it fails only, with ConfigStoreException,
  /// for an empty namespace.
  static std::shared_ptr<ConfigStore> GetStore(const std::string& namespaceName);

  /// The stored object as a copy, or an empty reference when there is none of that identity.
  virtual std::shared_ptr<StoreObject> GetObject(const ConfigStoreObjectId& id) = 0;

  /// Tells whether there is an object of that identity.
  virtual bool HasObject(const ConfigStoreObjectId& id) = 0;

  /// The identities of all objects of the group of the component, sorted by key.
  virtual std::vector<ConfigStoreObjectId> ListObjects(const std::string& group,
                                                       const std::string& component) = 0;

  /// The number of objects in this namespace.
  virtual std::size_t CountObjects() = 0;

  /// Writes the object: creates it, or replaces it whole, so that fields of an earlier object of that
  /// identity that this one does not have are gone. `flags` has no meaning yet and must be 0; anything else
  /// and an empty reference are refused with ConfigStoreException.
  virtual void PutObject(std::shared_ptr<ConfigStoreObject> object, int flags) = 0;

  /// As PutObject for several objects in one transaction: all of them are written, or none.
  virtual void PutObjects(const std::vector<std::shared_ptr<ConfigStoreObject>>& objects, int flags) = 0;

  /// The namespace that this store was asked for.
  virtual std::string GetNamespace() const = 0;

  /// The path of the database file, for messages.
  virtual std::string GetPath() const = 0;

  /// Looks through the whole database for damage and throws when there is some. Every other operation looks
  /// at all that it uses; this one also finds damage in what nobody has asked for yet.
  virtual void Verify() = 0;

  /// Removes the object; does nothing when there is none of that identity.
  virtual void RemoveObject(const ConfigStoreObjectId& id) = 0;

  /// Removes all objects of the group of the component in one transaction, and returns their number.
  virtual std::size_t RemoveObjects(const std::string& group, const std::string& component) = 0;

  virtual ~ConfigStore();

 protected:
  ConfigStore();
};

}  // namespace OrvConfigStore

#endif
