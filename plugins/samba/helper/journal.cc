#include "helper/journal.h"

#include <nlohmann/json.hpp>

#include "common/files.h"
#include "common/paths.h"

namespace sambaprovider {

NLOHMANN_JSON_SERIALIZE_ENUM(Journal::Operation, {{Journal::Operation::kJoin, "join"},
                                                  {Journal::Operation::kLeave, "leave"},
                                                  {Journal::Operation::kPrefer, "prefer"}})

std::optional<Journal> LoadJournal() {
  const auto text = ReadFile(paths::kJournal);
  if (!text) return std::nullopt;
  try {
    const nlohmann::json json = nlohmann::json::parse(*text);
    Journal journal;
    json.at("operation").get_to(journal.operation);
    json.at("dnsDomain").get_to(journal.dnsDomain);
    json.at("netbiosDomain").get_to(journal.netbiosDomain);
    json.at("computer").get_to(journal.computer);
    json.at("accountMadeAt").get_to(journal.accountMadeAt);
    return journal;
  } catch (const nlohmann::json::exception&) {
    return std::nullopt;
  }
}

void SaveJournal(const Journal& journal) {
  const nlohmann::json json = {{"operation", journal.operation},
                               {"dnsDomain", journal.dnsDomain},
                               {"netbiosDomain", journal.netbiosDomain},
                               {"computer", journal.computer},
                               {"accountMadeAt", journal.accountMadeAt}};
  ReplaceFile(paths::kJournal, json.dump(2) + "\n", 0600);
}

void RemoveJournal() {
  RemoveFile(paths::kJournal);
}

}  // namespace sambaprovider
