#include "systemconfiguration/nss_database.h"

#include <optional>
#include <string_view>

#include "nss_database_keywords.h"
#include "systemconfiguration/exceptions.h"

namespace SystemConfiguration {
namespace {

constexpr std::string_view messagePrefix = "Invalid Database: ";

NSSDatabase::Database DatabaseOf(const std::string& word) {
  if (const std::optional<NSSDatabase::Database> value = FindValue(databaseKeywords, word)) return *value;
  throw InvalidDatabaseException(MessageForUnknown(messagePrefix, word));
}

}  // namespace

NSSDatabase::NSSDatabase() : value_() {}

NSSDatabase::NSSDatabase(Database value) : value_(value) {}

NSSDatabase::NSSDatabase(const std::string& word) : value_(DatabaseOf(word)) {}

NSSDatabase& NSSDatabase::operator=(Database value) {
  value_ = value;
  return *this;
}

NSSDatabase& NSSDatabase::operator=(const std::string& word) {
  value_ = DatabaseOf(word);
  return *this;
}

bool NSSDatabase::operator==(const NSSDatabase& other) const {
  return value_ == other.value_;
}

bool NSSDatabase::operator==(Database value) const {
  return value_ == value;
}

bool NSSDatabase::operator==(const std::string& word) const {
  return value_ == DatabaseOf(word);
}

NSSDatabase::operator std::string() const {
  if (const std::optional<std::string_view> keyword = FindText(databaseKeywords, value_)) {
    return std::string(*keyword);
  }
  throw InvalidDatabaseException(MessageWithoutKeyword(messagePrefix, value_));
}

NSSDatabase::operator Database() const {
  return value_;
}

}  // namespace SystemConfiguration
