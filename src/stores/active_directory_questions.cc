// The questions: each asks on a thread of its own, waits no longer than the store's time-out, and answers
// from the cache, which holds the fresh answer by then or else the last one.

#include <syslog.h>

#include "authentication/active_directory_store.h"
#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"
#include "errors/request_state.h"
#include "stores/ad_cache.h"

namespace quenix::authentication {

namespace {

/// Waits for `request`; runs `whenLate` when it takes longer than the time-out.
template <class WhenLate>
void WaitOr(RequestState& request, int timeoutSeconds, WhenLate whenLate) {
  try {
    request.WaitResult(timeoutSeconds);
  } catch (const ProviderCallTimedOutException&) {
    whenLate();
  }
}

}  // namespace

std::unique_ptr<StoreConfiguration> ActiveDirectoryStore::GetStoreConfiguration() const {
  const auto request = StartOrAttachToRequest("StoreConfig", [provider = provider_](const std::string& key) {
    GetStoreConfigurationInt(provider, key);
  });
  WaitOr(*request, requestTimeoutSeconds_,
         [] { syslog(LOG_WARNING, "GetStoreConfiguration call timedout. Returning cached value."); });
  return std::make_unique<ActiveDirectoryStoreConfiguration>(_adCache.GetConfiguration());
}

std::deque<Domain> ActiveDirectoryStore::GetTrustedDomains() const {
  const auto request = StartOrAttachToRequest(
      "TrustedDomains",
      [provider = provider_](const std::string& key) { GetTrustedDomainsInt(provider, key); });
  WaitOr(*request, requestTimeoutSeconds_,
         [] { syslog(LOG_WARNING, "GetTrustedDomains call timedout. Returning cached value."); });
  return _adCache.GetTrustedDomains();
}

TrustState ActiveDirectoryStore::GetDomainTrustState() const {
  try {
    GetTrustedDomains();
  } catch (const FileNotFoundException&) {
    _adCache.SetDomainTrustState(TRUST_STATE_NOT_KNOWN);
    return TRUST_STATE_NOT_KNOWN;
  } catch (const Exception& failure) {
    syslog(LOG_WARNING, "GetDomainTrustState: Call to GetTrustedDomains() failed: %s", failure.what());
  }

  const auto request = StartOrAttachToRequest("TrustState", [provider = provider_](const std::string& key) {
    GetDomainTrustStateInt(provider, key);
  });
  WaitOr(*request, requestTimeoutSeconds_, [] {
    syslog(LOG_WARNING, "GetDomainTrustState call timedout. Returning cached value.");
    _adCache.SetDomainTrustState(TRUST_STATE_TIMED_OUT);
  });
  return _adCache.GetDomainTrustState();
}

TrustRelationship ActiveDirectoryStore::GetDomainTrustRelationship(const std::string& domain) const {
  const auto request = StartOrAttachToRequest("TrustRelationship:" + domain,
                                              [provider = provider_, domain](const std::string& key) {
                                                GetDomainTrustRelationshipInt(provider, key, domain);
                                              });
  WaitOr(*request, requestTimeoutSeconds_, [&] {
    syslog(LOG_WARNING, "GetDomainTrustRelationship call timedout. Returning cached value for %s.",
           domain.c_str());
  });
  return _adCache.GetDomainTrustRelationship(domain);
}

}  // namespace quenix::authentication
