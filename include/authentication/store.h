/// The interface of every authentication store, and of those that are recorded as the host's active choice.
#ifndef AUTHENTICATION_STORE_H
#define AUTHENTICATION_STORE_H

#include <memory>
#include <string>

#include "authentication/export.h"

namespace quenix::authentication {

/// Base of every store's settings record.
class VELMOR_EXPORT StoreConfiguration {
 public:
  StoreConfiguration() = default;
  StoreConfiguration(const StoreConfiguration&) = default;
  StoreConfiguration(StoreConfiguration&&) = default;
  StoreConfiguration& operator=(const StoreConfiguration&) = default;
  StoreConfiguration& operator=(StoreConfiguration&&) = default;
  virtual ~StoreConfiguration();
};

/// A way to authenticate the host's users.
class VELMOR_EXPORT AuthenticationStore {
 public:
  /// Returns a new record of the store's settings, of the store's own kind, owned by the caller.
  virtual std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const = 0;

  /// The store's name: what it is registered under and what is recorded when it is active.
  virtual std::string GetDisplayName() const = 0;

  /// Whether this store is the host's active one.
  virtual bool IsActive() const = 0;

  /// Makes this store the host's active one.
  virtual void MakeActive() = 0;

  virtual ~AuthenticationStore();

 protected:
  AuthenticationStore() = default;
  AuthenticationStore(const AuthenticationStore&) = default;
  AuthenticationStore& operator=(const AuthenticationStore&) = default;
};

/// A store whose activation is recorded in AuthenticationConfiguration.
class VELMOR_EXPORT RemoteAuthenticationStore : public AuthenticationStore {
 public:
  /// Reads the record and compares it with the display name, byte for byte; nothing is cached.
  /// Throws what reading AuthenticationConfiguration throws, and InvalidKeyException when it has no
  /// "remote-authentication-store".
  bool IsActive() const override;

  ~RemoteAuthenticationStore() override;

  /// Called on the store that was active before, when another one has been recorded.
  virtual void MakeInactive() = 0;
};

/// A remote store that asks a directory.
class VELMOR_EXPORT DirectoryStore : public RemoteAuthenticationStore {
 public:
  ~DirectoryStore() override;
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_STORE_H
