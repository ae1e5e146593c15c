#include "authentication/store.h"

#include "authentication/configuration.h"
#include "stores/active_store_record.h"

namespace quenix::authentication {

StoreConfiguration::~StoreConfiguration() = default;
AuthenticationStore::~AuthenticationStore() = default;
RemoteAuthenticationStore::~RemoteAuthenticationStore() = default;
DirectoryStore::~DirectoryStore() = default;

bool RemoteAuthenticationStore::IsActive() const {
  const AuthenticationConfiguration configuration;
  const std::string name = GetDisplayName();
  return configuration[activeStoreKey] == name;
}

}  // namespace quenix::authentication
