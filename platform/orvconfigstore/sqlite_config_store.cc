#include "orvconfigstore/sqlite_config_store.h"

#include <optional>
#include <utility>

#include "orvconfigstore/database.h"
#include "orvconfigstore/database_error.h"
#include "orvconfigstore/database_file.h"
#include "orvconfigstore/object_table.h"

namespace OrvConfigStore {
namespace {

using Objects = std::vector<std::shared_ptr<ConfigStoreObject>>;

void RequirePutArguments(const Objects& objects, int flags) {
  if (flags != 0) throw ConfigStoreException("The configuration store knows no flags but 0");
  for (const auto& object : objects) {
    if (!object) throw ConfigStoreException("The configuration store was given no object to put");
  }
}

/// Asks `question` about the objects of the namespace; a host without a database gives `answerWithout`.
template <typename Answer, typename Question>
Answer Ask(const std::string& namespaceName, Answer answerWithout, const Question& question) {
  const std::optional<Database> database = Database::Open(Database::Purpose::kReading);
  return database ? Answer(question(ObjectTable(*database, namespaceName))) : answerWithout;
}

}  // namespace

SqliteConfigStore::SqliteConfigStore(const std::string& namespaceName) : namespace_(namespaceName) {}

std::shared_ptr<StoreObject> SqliteConfigStore::GetObject(const ConfigStoreObjectId& id) {
  return Ask(namespace_, std::shared_ptr<StoreObject>(),
             [&id](const ObjectTable& table) { return table.Find(id); });
}

bool SqliteConfigStore::HasObject(const ConfigStoreObjectId& id) {
  return Ask(namespace_, false, [&id](const ObjectTable& table) { return table.Find(id) != nullptr; });
}

std::vector<ConfigStoreObjectId> SqliteConfigStore::ListObjects(const std::string& group,
                                                                const std::string& component) {
  return Ask(namespace_, std::vector<ConfigStoreObjectId>(),
             [&](const ObjectTable& table) { return table.List(group, component); });
}

std::size_t SqliteConfigStore::CountObjects() {
  return Ask(namespace_, std::size_t{0}, [](const ObjectTable& table) { return table.Count(); });
}

void SqliteConfigStore::PutObject(std::shared_ptr<ConfigStoreObject> object, int flags) {
  PutObjects({std::move(object)}, flags);
}

void SqliteConfigStore::PutObjects(const Objects& objects, int flags) {
  RequirePutArguments(objects, flags);
  CreateDatabaseWhenMissing();
  std::optional<Database> database = Database::Open(Database::Purpose::kWriting);
  if (!database) ThrowDatabaseError("somebody has just removed it");
  const ObjectTable table(*database, namespace_);
  for (const auto& object : objects) table.Replace(*object);
  database->Commit();
}

std::string SqliteConfigStore::GetNamespace() const {
  return namespace_;
}

std::string SqliteConfigStore::GetPath() const {
  return kDatabasePath;
}

void SqliteConfigStore::Verify() {
  Ask(namespace_, true, [](const ObjectTable& table) {
    for (const ConfigStoreObjectId& id : table.ListAll()) table.Find(id);
    return true;
  });
}

void SqliteConfigStore::RemoveObject(const ConfigStoreObjectId& id) {
  std::optional<Database> database = Database::Open(Database::Purpose::kWriting);
  if (!database) return;
  ObjectTable(*database, namespace_).Remove(id);
  database->Commit();
}

std::size_t SqliteConfigStore::RemoveObjects(const std::string& group, const std::string& component) {
  std::optional<Database> database = Database::Open(Database::Purpose::kWriting);
  if (!database) return 0;
  const ObjectTable table(*database, namespace_);
  const std::vector<ConfigStoreObjectId> ids = table.List(group, component);
  for (const ConfigStoreObjectId& id : ids) table.Remove(id);
  database->Commit();
  return ids.size();
}

}  // namespace OrvConfigStore
