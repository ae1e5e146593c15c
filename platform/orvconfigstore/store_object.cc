#include "orvconfigstore/store_object.h"

#include "orvconfigstore/config_store_exception.h"

namespace OrvConfigStore {
namespace {

std::string RequireText(const char* text, const char* what) {
  if (text == nullptr || *text == '\0') {
    throw ConfigStoreException(std::string("A configuration store object needs a ") + what);
  }
  return text;
}

}  // namespace

ConfigStoreObjectId::ConfigStoreObjectId(const char* key, const char* group, const char* component)
    : key_(RequireText(key, "key")),
      group_(RequireText(group, "group")),
      component_(RequireText(component, "component")) {}
ConfigStoreObjectId::ConfigStoreObjectId(const ConfigStoreObjectId& other) = default;
ConfigStoreObjectId& ConfigStoreObjectId::operator=(const ConfigStoreObjectId& other) = default;
ConfigStoreObjectId::~ConfigStoreObjectId() = default;

const std::string& ConfigStoreObjectId::GetKey() const {
  return key_;
}
const std::string& ConfigStoreObjectId::GetGroup() const {
  return group_;
}
const std::string& ConfigStoreObjectId::GetComponent() const {
  return component_;
}

bool ConfigStoreObjectId::operator==(const ConfigStoreObjectId& other) const {
  return key_ == other.key_ && group_ == other.group_ && component_ == other.component_;
}

bool ConfigStoreObjectId::operator!=(const ConfigStoreObjectId& other) const {
  return !(*this == other);
}

StoreObject::StoreObject(const ConfigStoreObjectId& id) : id_(id) {}
StoreObject::StoreObject(const StoreObject& other) = default;
StoreObject& StoreObject::operator=(const StoreObject& other) = default;
StoreObject::~StoreObject() = default;

const ConfigStoreObjectId& StoreObject::GetId() const {
  return id_;
}

bool StoreObject::GetValue(const char* field, std::string* out) const {
  if (field == nullptr || out == nullptr) return false;
  const auto found = values_.find(field);
  if (found == values_.end()) return false;
  *out = found->second;
  return true;
}

void StoreObject::SetValue(const char* field, const std::string& value) {
  values_.insert_or_assign(RequireText(field, "field name"), value);
}

const std::map<std::string, std::string>& StoreObject::GetValues() const {
  return values_;
}

ConfigStoreObject::ConfigStoreObject(const ConfigStoreObjectId& id) : StoreObject(id) {}
ConfigStoreObject::ConfigStoreObject(const ConfigStoreObject& other) = default;
ConfigStoreObject& ConfigStoreObject::operator=(const ConfigStoreObject& other) = default;
ConfigStoreObject::~ConfigStoreObject() = default;

}  // namespace OrvConfigStore
