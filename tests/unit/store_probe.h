/// The Active Directory store with its request machinery laid open.
#ifndef UNIT_STORE_PROBE_H
#define UNIT_STORE_PROBE_H

#include "authentication/active_directory_store.h"
#include "errors/mutex.h"
#include "errors/request_state.h"
#include "providers/active_directory_provider.h"
#include "stores/ad_cache.h"

namespace testsupport {

class StoreProbe : public quenix::authentication::ActiveDirectoryStore {
 public:
  using ActiveDirectoryStore::_adCache;
  using ActiveDirectoryStore::_asyncRequests;
  using ActiveDirectoryStore::_lock;
  using ActiveDirectoryStore::ActiveDirectoryStore;
  using ActiveDirectoryStore::FinishRequest;
  using ActiveDirectoryStore::GetDomainTrustRelationshipInt;
  using ActiveDirectoryStore::GetDomainTrustStateInt;
  using ActiveDirectoryStore::GetStoreConfigurationInt;
  using ActiveDirectoryStore::GetTrustedDomainsInt;
  using ActiveDirectoryStore::StartOrAttachToRequest;

  /// How many requests are in flight.
  static std::size_t RequestsInFlight() {
    const quenix::authentication::MutexLock lock(_lock);
    return _asyncRequests.size();
  }

  static bool IsInFlight(const std::string& key) {
    const quenix::authentication::MutexLock lock(_lock);
    return _asyncRequests.count(key) != 0;
  }
};

}  // namespace testsupport

#endif  // UNIT_STORE_PROBE_H
