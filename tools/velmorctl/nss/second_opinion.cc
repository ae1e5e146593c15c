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

/// The model loses what stands behind a criterion.
bool CanBeModelled(const Meaning& services) {
  return std::all_of(services.begin(), services.end(), [&services](const ServiceMeaning& service) {
    return service.criterion.empty() || &service == &services.back();
  });
}

}  // namespace

bool ModelAgrees(const SwitchFile& before, const SwitchFile& after, const WantedLine& wanted) {
  std::optional<NSSConfiguration> modelBefore = Read(before.Text());
  std::optional<NSSConfiguration> modelAfter = Read(after.Text());
  if (!modelBefore) {
    return true;
  }
  if (!modelAfter) {
    return false;
  }
  const std::optional<NSSDatabase> edited = DatabaseCalled(wanted.database);
  if (!OthersAreEqual(*modelBefore, *modelAfter, edited)) {
    return false;
  }
  const std::vector<const SwitchLine*> lines = before.LinesOf(wanted.database);
  const Meaning meaningBefore = lines.empty() ? Meaning() : lines.front()->Meaning();
  const bool hasOpinion =
      edited && MeaningOf(*modelBefore, *edited) == meaningBefore && CanBeModelled(wanted.services);
  return !hasOpinion || MeaningOf(*modelAfter, *edited) == wanted.services;
}

}  // namespace velmorctl
