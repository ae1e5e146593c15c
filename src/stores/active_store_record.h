/// Where the active store is recorded.
#ifndef STORES_ACTIVE_STORE_RECORD_H
#define STORES_ACTIVE_STORE_RECORD_H

namespace quenix::authentication {

/// The key of AuthenticationConfiguration whose value is the active store's display name.
inline constexpr const char* activeStoreKey = "remote-authentication-store";

}  // namespace quenix::authentication

#endif  // STORES_ACTIVE_STORE_RECORD_H
