#include "authentication/no_remote_authentication_store.h"

#include <stdexcept>
#include <typeinfo>

#include "authentication/authentication_store_factory.h"
#include "authentication/configuration.h"
#include "authentication/library_exceptions.h"
#include "stores/active_store_record.h"

namespace quenix::authentication {

namespace {

/// Lets the store of that name deactivate itself.
void MakeStoreInactive(const std::string& name) {
  const auto store = Singleton<AuthenticationStoreFactory>::_instance->CreateInstance(name);
  if (!store) throw UnknownRemoteAuthenticationStoreException(name);
  try {
    dynamic_cast<RemoteAuthenticationStore&>(*store).MakeInactive();
  } catch (const std::bad_cast&) {
    throw InvalidRemoteAuthenticationStoreException(name);
  }
}

}  // namespace

NoRemoteAuthenticationStoreConfiguration::~NoRemoteAuthenticationStoreConfiguration() = default;

NoRemoteAuthenticationStore::NoRemoteAuthenticationStore() = default;
NoRemoteAuthenticationStore::~NoRemoteAuthenticationStore() = default;

std::unique_ptr<StoreConfiguration> NoRemoteAuthenticationStore::GetStoreConfiguration() const {
  return std::make_unique<NoRemoteAuthenticationStoreConfiguration>(configuration_);
}

std::string NoRemoteAuthenticationStore::GetDisplayName() const {
  return "None";
}

void NoRemoteAuthenticationStore::MakeActive() {
  AuthenticationConfiguration configuration;
  const std::string previousName = configuration[activeStoreKey];
  if (previousName == GetDisplayName()) return;
  configuration[activeStoreKey] = GetDisplayName();
  configuration.Write();
  MakeStoreInactive(previousName);
}

void NoRemoteAuthenticationStore::MakeInactive() {
  throw std::runtime_error("Attempted to disable None Store");
}

}  // namespace quenix::authentication
