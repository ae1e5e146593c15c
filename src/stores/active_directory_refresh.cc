// The refresh of the whole cache, question by question.

#include <syslog.h>

#include <chrono>
#include <exception>

#include "authentication/active_directory_store.h"
#include "stores/ad_cache.h"

namespace quenix::authentication {

namespace {

constexpr int stepsOfARefresh = 5;
constexpr int stepsOfAMemberOnly = 4;

int MillisecondsSince(std::chrono::steady_clock::time_point start) {
  const auto elapsed = std::chrono::steady_clock::now() - start;
  return static_cast<int>(std::chrono::duration_cast<std::chrono::milliseconds>(elapsed).count());
}

}  // namespace

bool ActiveDirectoryStore::FetchAdConfig() {
  try {
    GetStoreConfiguration();
    return true;
  } catch (const std::exception& failure) {
    syslog(LOG_ERR, "Failed to get AD config: %s", failure.what());
    return false;
  }
}

bool ActiveDirectoryStore::FetchDomainTrustState() {
  try {
    GetDomainTrustState();
    return true;
  } catch (const Exception& failure) {
    syslog(LOG_ERR, "Failed to get domain trust state: %s", failure.what());
    return false;
  }
}

bool ActiveDirectoryStore::FetchTrustedDomains() {
  try {
    GetTrustedDomains();
    return true;
  } catch (const std::exception& failure) {
    syslog(LOG_ERR, "Failed to get trusted domains: %s", failure.what());
    return false;
  }
}

bool ActiveDirectoryStore::FetchTrustRelationships() {
  _adCache.IncreaseTrustRelationshipsGenNo();
  bool complete = true;
  for (const Domain& domain : _adCache.GetAllDomains()) {
    try {
      GetDomainTrustRelationship(domain.dnsName);
    } catch (const std::exception& failure) {
      syslog(LOG_ERR, "Failed to get trust relationship for %s: %s", domain.dnsName.c_str(), failure.what());
      complete = false;
    }
  }
  _adCache.CleanupOldTrustRelationships();
  return complete;
}

bool ActiveDirectoryStore::FetchScEnabledSvcs() {
  try {
    _adCache.SetSmartCardEnabledServices(GetSmartCardEnabledServices());
    return true;
  } catch (const Exception& failure) {
    syslog(LOG_ERR, "Failed to get smart card enabled services: %s", failure.what());
    return false;
  }
}

void ActiveDirectoryStore::UpdateCache(std::optional<bool> pcscdServicePolicy) {
  const auto start = std::chrono::steady_clock::now();
  int stepsDone = FetchAdConfig() ? 1 : 0;
  if (_adCache.IsDomainMember()) {
    stepsDone += FetchDomainTrustState() ? 1 : 0;
    stepsDone += FetchTrustedDomains() ? 1 : 0;
    stepsDone += FetchTrustRelationships() ? 1 : 0;
    stepsDone += FetchScEnabledSvcs() ? 1 : 0;
  } else {
    stepsDone += stepsOfAMemberOnly;
  }
  if (pcscdServicePolicy) _adCache.SetPcscdSvcPolicyOn(*pcscdServicePolicy);

  const int milliseconds = MillisecondsSince(start);
  if (stepsDone == stepsOfARefresh) {
    syslog(LOG_DEBUG, "AD cache updated in %i ms", milliseconds);
  } else {
    syslog(LOG_WARNING, "AD cache updated partially in %i ms", milliseconds);
  }
}

}  // namespace quenix::authentication
