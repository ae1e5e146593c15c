#include "authentication/active_directory_store.h"

#include <syslog.h>

#include <utility>

#include "authentication/active_directory_config_store.h"
#include "authentication/configuration.h"
#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"
#include "providers/active_directory_provider.h"
#include "providers/optional_operation.h"
#include "stores/active_store_record.h"
#include "stores/ad_cache.h"

namespace quenix::authentication {

namespace {

/// The provider that the configuration names; empty when it names none.
std::string ConfiguredProvider() {
  try {
    const ProviderConfiguration configuration;
    const auto provider = configuration.find("provider");
    return provider == configuration.end() ? "" : provider->second;
  } catch (const IOError&) {
    throw InvalidActiveDirectoryProviderException("(none installed)");
  }
}

std::shared_ptr<ActiveDirectoryProvider> LoadConfiguredProvider() {
  const std::string name = ConfiguredProvider();
  if (name.empty()) throw InvalidActiveDirectoryProviderException("(unset)");
  try {
    return std::make_shared<ActiveDirectoryProvider>(name);
  } catch (const IOError&) {
    throw InvalidActiveDirectoryProviderException(name);
  }
}

void RequireUsable(const Credentials& credentials) {
  if (credentials.username == nullptr) throw InvalidCredentialsException("no username was specified");
  if (credentials.password == nullptr || *credentials.password == '\0') {
    throw InvalidCredentialsException(
        "empty or no password was specified; the account must have a non-empty password to join the host to "
        "domain");
  }
}

struct JoinTarget {
  std::string domain;
  std::string organizationalUnit;
};

/// "DOMAIN" or "DOMAIN/OU"; a path may hold more slashes.
JoinTarget ParseJoinTarget(const std::string& text) {
  const auto slash = text.find('/');
  if (slash == std::string::npos) return {text, ""};
  return {text.substr(0, slash), text.substr(slash + 1)};
}

}  // namespace

ActiveDirectoryStore::ActiveDirectoryStore(int requestTimeoutSeconds)
    : requestTimeoutSeconds_(requestTimeoutSeconds), provider_(LoadConfiguredProvider()) {}

ActiveDirectoryStore::~ActiveDirectoryStore() = default;

std::string ActiveDirectoryStore::GetDisplayName() const {
  return "Active Directory";
}

void ActiveDirectoryStore::MakeActive() {
  AuthenticationConfiguration configuration;
  configuration[activeStoreKey] = GetDisplayName();
  configuration.Write();
  UpdateCache(std::nullopt);
}

void ActiveDirectoryStore::MakeInactive() {
  UpdateCache(std::nullopt);
}

void ActiveDirectoryStore::JoinDomain(const std::string& domain, const Credentials& credentials,
                                      bool skipHostnameCheck) {
  RequireUsable(credentials);
  const JoinTarget target = ParseJoinTarget(domain);
  if (!skipHostnameCheck) SanitiseHostnameForDomain(target.domain);
  provider_->JoinDomain(target.domain, target.organizationalUnit, credentials);
  try {
    ActiveDirectoryConfigStore().StoreDomainInfo(target.domain, target.organizationalUnit, "");
  } catch (const OrvConfigStore::ConfigStoreException& failure) {
    syslog(LOG_ERR, "Failed to store domain details to Config Store: %s.Leaving Domain...", failure.what());
    provider_->PartDomain();
    throw;
  }
}

void ActiveDirectoryStore::PartDomain() {
  provider_->PartDomain();
  try {
    ActiveDirectoryConfigStore().RemoveDomainInfo();
  } catch (const OrvConfigStore::ConfigStoreException& failure) {
    syslog(LOG_ERR, "Failed to remove domain details from Config Store: %s", failure.what());
    throw;
  }
}

void ActiveDirectoryStore::PartDomain(const Credentials& credentials) {
  provider_->PartDomain(credentials);
}

std::string ActiveDirectoryStore::GetDomainControllerForDomain(const std::string& domain) const {
  return AskOrElse([&] { return provider_->GetAnyDomainController("", domain); }, "");
}

std::string ActiveDirectoryStore::GetHostPrincipalForDomain(const std::string& domain) const {
  return AskOrElse([&] { return provider_->GetHostPrincipalForDomain(domain); }, "");
}

std::string ActiveDirectoryStore::ConvertCanonicalUsername(const std::string& name) const {
  return AskOrElse([&] { return provider_->ConvertCanonicalUsername(name); }, name);
}

void ActiveDirectoryStore::SetPreferredDomainControllers(const std::deque<std::string>& controllers) {
  try {
    provider_->SetPreferredDomainControllers(controllers);
  } catch (const CallNotImplementedException&) {
    syslog(LOG_WARNING, "Setting of preferred domain controllers is not implemented.");
  }
}

std::vector<std::string> ActiveDirectoryStore::GetSmartCardEnabledServices() const {
  return provider_->GetSmartCardEnabledServices();
}

void ActiveDirectoryStore::SetSmartCardEnabledServices(const std::vector<std::string>& services) const {
  provider_->SetSmartCardEnabledServices(services);
  _adCache.SetSmartCardEnabledServices(services);
}

}  // namespace quenix::authentication
