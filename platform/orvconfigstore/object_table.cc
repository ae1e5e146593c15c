#include "orvconfigstore/object_table.h"

#include <cstdint>

#include "orvconfigstore/database_error.h"
#include "orvconfigstore/record_checksum.h"

namespace OrvConfigStore {
namespace {

/// Reads the rows of a query for key, group and component.
std::vector<ConfigStoreObjectId> ReadIds(Statement* query) {
  std::vector<ConfigStoreObjectId> ids;
  while (query->Step()) {
    ids.emplace_back(query->GetText(0).c_str(), query->GetText(1).c_str(), query->GetText(2).c_str());
  }
  return ids;
}

}  // namespace

ObjectTable::ObjectTable(const Database& database, const std::string& namespaceName)
    : database_(database), namespace_(namespaceName) {}

std::shared_ptr<ConfigStoreObject> ObjectTable::Find(const ConfigStoreObjectId& id) const {
  Statement query = PrepareFor(
      "SELECT id, checksum FROM object WHERE namespace = ? AND component = ? AND grp = ? AND key = ?", id);
  if (!query.Step()) return nullptr;
  auto object = std::make_shared<ConfigStoreObject>(id);
  Statement fields = database_.Prepare("SELECT name, value FROM field WHERE object = ?");
  fields.BindInteger(query.GetInteger(0));
  while (fields.Step()) object->SetValue(fields.GetText(0).c_str(), fields.GetBytes(1));
  if (query.GetInteger(1) != ChecksumOf(namespace_, *object)) {
    ThrowDatabaseError("it is damaged: the object '" + id.GetKey() + "' is not as it was written");
  }
  return object;
}

std::vector<ConfigStoreObjectId> ObjectTable::List(const std::string& group,
                                                   const std::string& component) const {
  Statement query = database_.Prepare(
      "SELECT key, grp, component FROM object WHERE namespace = ? AND grp = ? AND component = ? ORDER BY "
      "key");
  query.BindText(namespace_).BindText(group).BindText(component);
  return ReadIds(&query);
}

std::vector<ConfigStoreObjectId> ObjectTable::ListAll() const {
  Statement query = database_.Prepare("SELECT key, grp, component FROM object WHERE namespace = ?");
  query.BindText(namespace_);
  return ReadIds(&query);
}

std::size_t ObjectTable::Count() const {
  Statement query = database_.Prepare("SELECT count(*) FROM object WHERE namespace = ?");
  query.BindText(namespace_).Step();
  return static_cast<std::size_t>(query.GetInteger(0));
}

void ObjectTable::Replace(const ConfigStoreObject& object) const {
  Remove(object.GetId());
  Statement insertion = PrepareFor(
      "INSERT INTO object (namespace, component, grp, key, checksum) VALUES (?, ?, ?, ?, ?) RETURNING id",
      object.GetId());
  insertion.BindInteger(ChecksumOf(namespace_, object)).Step();
  const std::int64_t row = insertion.GetInteger(0);
  insertion.Step();
  for (const auto& [field, value] : object.GetValues()) {
    Statement fieldInsertion = database_.Prepare("INSERT INTO field (object, name, value) VALUES (?, ?, ?)");
    fieldInsertion.BindInteger(row).BindText(field).BindBytes(value).Step();
  }
}

void ObjectTable::Remove(const ConfigStoreObjectId& id) const {
  PrepareFor(
      "DELETE FROM field WHERE object IN"
      " (SELECT id FROM object WHERE namespace = ? AND component = ? AND grp = ? AND key = ?)",
      id)
      .Step();
  PrepareFor("DELETE FROM object WHERE namespace = ? AND component = ? AND grp = ? AND key = ?", id).Step();
}

Statement ObjectTable::PrepareFor(const char* sql, const ConfigStoreObjectId& id) const {
  Statement statement = database_.Prepare(sql);
  statement.BindText(namespace_).BindText(id.GetComponent()).BindText(id.GetGroup()).BindText(id.GetKey());
  return statement;
}

}  // namespace OrvConfigStore
