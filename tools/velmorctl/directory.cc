#include "directory.h"

#include <CLI/App.hpp>

#include "authentication/active_directory_config_store.h"
#include "failure.h"
#include "orvconfigstore/config_store.h"
#include "plugin_file.h"
#include "settings_file.h"

namespace velmorctl {

using quenix::authentication::ActiveDirectoryConfigStore;
using quenix::authentication::ActiveDirectoryStore;
using quenix::authentication::ActiveDirectoryStoreConfiguration;
using quenix::authentication::Domain;

void AddTimeoutOption(CLI::App& command, int& timeoutSeconds) {
  command.add_option("--timeout", timeoutSeconds, "Wait this many seconds for each answer of the provider")
      ->check(CLI::Range(1, 3600))
      ->capture_default_str();
}

void RequireUsableProvider() {
  SettingsInspection settings = InspectProviderFile();
  if (settings.problem) {
    return;
  }
  PluginDescription plugin = InspectProvider(settings.value);
  if (plugin.problem) {
    throw AsFailure(*plugin.problem, ExitCode::ProviderUnusable,
                    "the provider '" + plugin.name + "' cannot be used");
  }
}

std::optional<JoinRecord> ReadJoinRecord() {
  auto store = OrvConfigStore::ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace);
  auto object = store->GetObject(ActiveDirectoryConfigStore::AD_CSO_ID);
  if (!object) {
    return std::nullopt;
  }
  JoinRecord record;
  object->GetValue("domain_name", &record.domainName);
  object->GetValue("organizational_unit", &record.organizationalUnit);
  return record;
}

Directory::Directory(std::chrono::seconds timeout) : watch_(timeout) {
  RequireUsableProvider();
  store_ = std::make_shared<ActiveDirectoryStore>(static_cast<int>(timeout.count()));
}

Answer<ActiveDirectoryStoreConfiguration> Directory::Configuration() {
  return watch_.Ask([this] {
    auto configuration = store_->GetStoreConfiguration();
    return dynamic_cast<ActiveDirectoryStoreConfiguration&>(*configuration);
  });
}

Answer<std::deque<Domain>> Directory::TrustedDomains() {
  return watch_.Ask([this] { return store_->GetTrustedDomains(); });
}

Answer<TrustState> Directory::State() {
  return watch_.Ask([this] { return store_->GetDomainTrustState(); });
}

Answer<TrustRelationship> Directory::RelationshipWith(const std::string& domain) {
  return watch_.Ask([this, &domain] { return store_->GetDomainTrustRelationship(domain); });
}

std::optional<std::string> Directory::ControllerOf(const std::string& domain) {
  return watch_.Call([store = store_, domain] { return store->GetDomainControllerForDomain(domain); });
}

std::optional<std::vector<std::string>> Directory::SmartCardServices() {
  return watch_.Call([store = store_] { return store->GetSmartCardEnabledServices(); });
}

std::string Directory::JoinedDomain() {
  std::string domain = Configuration().value.activeDomain.dnsName;
  if (!domain.empty()) {
    return domain;
  }
  if (std::optional<JoinRecord> record = ReadJoinRecord()) {
    return record->domainName;
  }
  throw Failure(ExitCode::NotJoined, "the host has joined no domain").Try("velmorctl join DOMAIN");
}

}  // namespace velmorctl
