#ifndef ORVCONFIGSTORE_STORE_OBJECT_H
#define ORVCONFIGSTORE_STORE_OBJECT_H

#include <map>
#include <string>

#include "hostmgmt/export.h"

namespace OrvConfigStore {

/// The identity of a stored object within its namespace. A value; needs nothing that a static object could
/// find not yet constructed.
class HOSTMGMT_EXPORT ConfigStoreObjectId {
 public:
  /// Throws ConfigStoreException when one of the strings is a null pointer or empty.
  ConfigStoreObjectId(const char* key, const char* group, const char* component);
  ConfigStoreObjectId(const ConfigStoreObjectId& other);
  ConfigStoreObjectId& operator=(const ConfigStoreObjectId& other);
  ~ConfigStoreObjectId();

  const std::string& GetKey() const;
  const std::string& GetGroup() const;
  const std::string& GetComponent() const;

  bool operator==(const ConfigStoreObjectId& other) const;
  bool operator!=(const ConfigStoreObjectId& other) const;

 private:
  std::string key_;
  std::string group_;
  std::string component_;
};

/// An object of the store: its identity and its fields, which are text of any length and any bytes. It is a
/// copy: changing it changes nothing in the store. One object must not be changed on one thread while
/// another uses it.
class HOSTMGMT_EXPORT StoreObject {
 public:
  virtual ~StoreObject();

  const ConfigStoreObjectId& GetId() const;

  /// Copies the field's value into `*out` and returns true; returns false and leaves `*out` as it is when
  /// the object has no such field.
  bool GetValue(const char* field, std::string* out) const;

  /// Sets the field. Throws ConfigStoreException when `field` is a null pointer or empty.
  void SetValue(const char* field, const std::string& value);

  /// All fields by name.
  const std::map<std::string, std::string>& GetValues() const;

 protected:
  explicit StoreObject(const ConfigStoreObjectId& id);
  StoreObject(const StoreObject& other);
  StoreObject& operator=(const StoreObject& other);

 private:
  ConfigStoreObjectId id_;
  std::map<std::string, std::string> values_;
};

/// An object to be put into the store, built from scratch.
class HOSTMGMT_EXPORT ConfigStoreObject : public StoreObject {
 public:
  /// An object without fields.
  explicit ConfigStoreObject(const ConfigStoreObjectId& id);
  ConfigStoreObject(const ConfigStoreObject& other);
  ConfigStoreObject& operator=(const ConfigStoreObject& other);
  ~ConfigStoreObject() override;
};

}  // namespace OrvConfigStore

#endif
