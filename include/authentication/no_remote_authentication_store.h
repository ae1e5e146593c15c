/// The store "None": users are authenticated against the host's own accounts only.
#ifndef AUTHENTICATION_NO_REMOTE_AUTHENTICATION_STORE_H
#define AUTHENTICATION_NO_REMOTE_AUTHENTICATION_STORE_H

#include <memory>
#include <string>

#include "authentication/export.h"
#include "authentication/store.h"

namespace quenix::authentication {

/// The settings of the store "None": there are none.
class VELMOR_EXPORT NoRemoteAuthenticationStoreConfiguration : public StoreConfiguration {
 public:
  NoRemoteAuthenticationStoreConfiguration() = default;
  NoRemoteAuthenticationStoreConfiguration(const NoRemoteAuthenticationStoreConfiguration&) = default;
  NoRemoteAuthenticationStoreConfiguration(NoRemoteAuthenticationStoreConfiguration&&) = default;
  NoRemoteAuthenticationStoreConfiguration& operator=(const NoRemoteAuthenticationStoreConfiguration&) =
      default;
  NoRemoteAuthenticationStoreConfiguration& operator=(NoRemoteAuthenticationStoreConfiguration&&) = default;
  ~NoRemoteAuthenticationStoreConfiguration() override;
};

/// The store "None". Has no state of its own: several may exist, on several threads.
class VELMOR_EXPORT NoRemoteAuthenticationStore : public RemoteAuthenticationStore {
 public:
  NoRemoteAuthenticationStore();

  /// Returns a new NoRemoteAuthenticationStoreConfiguration, owned by the caller.
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override;

  /// "None".
  std::string GetDisplayName() const override;

  /// Records "None" and then lets the store that was active before deactivate itself. Does nothing when
  /// "None" is recorded already. *Deliberate:* the record is written first and stays when a later step fails.
  ///
  /// Throws what reading and writing AuthenticationConfiguration throws; InvalidKeyException when it has no
  /// "remote-authentication-store"; UnknownRemoteAuthenticationStoreException or
  /// InvalidRemoteAuthenticationStoreException for the store that was recorded before; and what that store's
  /// MakeInactive() throws.
  void MakeActive() override;

  ~NoRemoteAuthenticationStore() override;

  /// Always throws std::runtime_error: the way out of "None" is to activate another store.
  void MakeInactive() override;

 private:
  NoRemoteAuthenticationStoreConfiguration configuration_;
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_NO_REMOTE_AUTHENTICATION_STORE_H
