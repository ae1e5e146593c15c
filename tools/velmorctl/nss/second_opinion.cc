#include "nss/second_opinion.h"

#include <algorithm>
#include <cstdint>
#include <optional>
#include <sstream>
#include <stdexcept>

#include "systemconfiguration/exceptions.h"
#include "systemconfiguration/nss_configuration.h"

namespace velmorctl {

namespace {

using SystemConfiguration::NSSConfiguration;
using SystemConfiguration::NSSDatabase;
using SystemConfiguration::NSSService;
using Meaning = std::vector<ServiceMeaning>;

std::optional<NSSConfiguration> Read(const std::string& text) {
  NSSConfiguration configuration;
  std::istringstream stream(text);
  try {
    stream >> configuration;
  } catch (const std::out_of_range&) {
    return std::nullopt;
  }
  return configuration;
}

std::optional<NSSDatabase> DatabaseCalled(const std::string& name) {
  try {
    return NSSDatabase(name);
  } catch (const SystemConfiguration::InvalidDatabaseException&) {
    return std::nullopt;
  }
}

Meaning MeaningOf(NSSConfiguration& configuration, NSSDatabase database) {
  Meaning meaning;
  for (const NSSService& service : configuration[database]) {
    meaning.push_back({service.module(), {service.parameters().begin(), service.parameters().end()}});
  }
  return meaning;
}

bool OthersAreEqual(NSSConfiguration& before, NSSConfiguration& after,
                    const std::optional<NSSDatabase>& edited) {
  for (std::uint32_t value = NSSDatabase::Passwd; value <= NSSDatabase::Aliases; ++value) {
    const auto database = static_cast<NSSDatabase::Database>(value);
    const bool isEdited = edited && *edited == database;
    if (!isEdited && MeaningOf(before, database) != MeaningOf(after, database)) {
      return false;
    }
  }
  return true;
}

/// The model reads a criterion of the only service; among several services it loses some.
bool CanBeModelled(const Meaning& services) {
  return services.size() == 1 ||
         std::all_of(services.begin(), services.end(),
                     [](const ServiceMeaning& service) { return service.criterion.empty(); });
}

}  // namespace

bool ModelAgrees(const SwitchFile& before, const SwitchFile& after, const WantedLine& wanted) {
  std::optional<NSSConfiguration> modelBefore = Read(before.Text());
  if (!modelBefore) {
    return true;
  }
  const std::optional<NSSDatabase> edited = DatabaseCalled(wanted.database);
  const std::vector<const SwitchLine*> lines = before.LinesOf(wanted.database);
  const Meaning meaningBefore = lines.empty() ? Meaning() : lines.front()->Meaning();
  const bool readsTheLine =
      edited && MeaningOf(*modelBefore, *edited) == meaningBefore && CanBeModelled(wanted.services);
  std::optional<NSSConfiguration> modelAfter = Read(after.Text());
  if (!modelAfter) {
    return !readsTheLine;
  }
  return OthersAreEqual(*modelBefore, *modelAfter, edited) &&
         (!readsTheLine || MeaningOf(*modelAfter, *edited) == wanted.services);
}

}  // namespace velmorctl
