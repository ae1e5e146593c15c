#include "authentication/authentication_store_factory.h"

#include "authentication/active_directory_store.h"
#include "authentication/no_remote_authentication_store.h"

namespace quenix::authentication {

namespace {

/// How long the factory's stores wait for the directory before they answer from the cache.
constexpr int requestTimeoutSeconds = 60;

template <class T>
std::unique_ptr<AuthenticationStore> Constructor() {
  return std::make_unique<T>();
}

template <>
std::unique_ptr<AuthenticationStore> Constructor<ActiveDirectoryStore>() {
  return std::make_unique<ActiveDirectoryStore>(requestTimeoutSeconds);
}

}  // namespace

AuthenticationStoreFactory::AuthenticationStoreFactory() {
  Singleton<AuthenticationStoreFactory>::_instance = this;
  try {
    RegisterType("Active Directory", &Constructor<ActiveDirectoryStore>);
    RegisterType("None", &Constructor<NoRemoteAuthenticationStore>);
  } catch (...) {
    constructors_.clear();
    Singleton<AuthenticationStoreFactory>::_instance = nullptr;
    throw;
  }
}

AuthenticationStoreFactory::~AuthenticationStoreFactory() {
  constructors_.clear();
  Singleton<AuthenticationStoreFactory>::_instance = nullptr;
}

void AuthenticationStoreFactory::RegisterType(const std::string& name, ConstructorFunction constructor) {
  constructors_.emplace(name, constructor);
}

std::unique_ptr<AuthenticationStore> AuthenticationStoreFactory::CreateInstance(const std::string& name) {
  const auto entry = constructors_.find(name);
  return entry == constructors_.end() ? nullptr : entry->second();
}

std::vector<std::string> AuthenticationStoreFactory::GetRegisteredStores() const {
  std::vector<std::string> names;
  names.reserve(constructors_.size());
  for (const auto& [name, constructor] : constructors_) names.push_back(name);
  return names;
}

}  // namespace quenix::authentication
