/// The registry of authentication stores.
#ifndef AUTHENTICATION_AUTHENTICATION_STORE_FACTORY_H
#define AUTHENTICATION_AUTHENTICATION_STORE_FACTORY_H

#include <map>
#include <memory>
#include <string>
#include <vector>

#include "authentication/export.h"
#include "authentication/store.h"

namespace quenix::authentication {

/// The one object of its class in the process; null before it is constructed and after it is destroyed.
template <class T>
class VELMOR_EXPORT Singleton {
 public:
  static T* _instance;
};

/// Creates stores by name.
///
/// The library builds the one factory while it is loaded and destroys it at unload or exit; callers reach it
/// through `Singleton<AuthenticationStoreFactory>::_instance`. CreateInstance() and GetRegisteredStores() may
/// be called from several threads at once, RegisterType() only while no other thread uses the factory.
class VELMOR_EXPORT AuthenticationStoreFactory {
 public:
  using ConstructorFunction = std::unique_ptr<AuthenticationStore> (*)();

  /// Publishes this factory as the process's one and registers "Active Directory" and "None".
  AuthenticationStoreFactory();
  AuthenticationStoreFactory(const AuthenticationStoreFactory&) = delete;
  AuthenticationStoreFactory& operator=(const AuthenticationStoreFactory&) = delete;
  ~AuthenticationStoreFactory();

  /// Registers a store. A name that is registered already stays as it is, without an error.
  void RegisterType(const std::string& name, ConstructorFunction constructor);

  /// Returns a new store, owned by the caller; null when no store of exactly this name is registered. What
  /// the store's constructor throws goes to the caller.
  std::unique_ptr<AuthenticationStore> CreateInstance(const std::string& name);

  /// Every registered name, in ascending byte-wise order.
  std::vector<std::string> GetRegisteredStores() const;

 private:
  std::map<std::string, ConstructorFunction> constructors_;
};

template <>
VELMOR_EXPORT AuthenticationStoreFactory* Singleton<AuthenticationStoreFactory>::_instance;

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_AUTHENTICATION_STORE_FACTORY_H
