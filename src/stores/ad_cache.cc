#include "stores/ad_cache.h"

#include <algorithm>

namespace quenix::authentication {

namespace {

bool ContainsAll(const std::vector<std::string>& list, const char* const* names, std::size_t count) {
  return std::all_of(names, names + count, [&list](const char* name) {
    return std::find(list.begin(), list.end(), name) != list.end();
  });
}

}  // namespace

ActiveDirectoryStoreConfiguration ADCache::GetConfiguration() const {
  const MutexLock lock(lock_);
  ActiveDirectoryStoreConfiguration configuration;
  configuration.activeDomain = domain_;
  configuration.preferredDomainControllers = preferredDomainControllers_;
  configuration.machineAccountDN = machineAccountDN_;
  return configuration;
}

void ADCache::SetConfiguration(ActiveDirectoryStoreConfiguration&& configuration) {
  const MutexLock lock(lock_);
  std::swap(domain_, configuration.activeDomain);
  std::swap(preferredDomainControllers_, configuration.preferredDomainControllers);
  std::swap(machineAccountDN_, configuration.machineAccountDN);
}

std::deque<Domain> ADCache::GetTrustedDomains() const {
  const MutexLock lock(lock_);
  return trustedDomains_;
}

void ADCache::SetTrustedDomains(std::deque<Domain>&& domains) {
  const MutexLock lock(lock_);
  trustedDomains_ = std::move(domains);
}

std::vector<Domain> ADCache::GetAllDomains() const {
  const MutexLock lock(lock_);
  std::vector<Domain> domains;
  domains.reserve(trustedDomains_.size() + 1);
  domains.push_back(domain_);
  domains.insert(domains.end(), trustedDomains_.begin(), trustedDomains_.end());
  return domains;
}

TrustState ADCache::GetDomainTrustState() const {
  const MutexLock lock(lock_);
  return trustState_;
}

void ADCache::SetDomainTrustState(TrustState state) {
  const MutexLock lock(lock_);
  trustState_ = state;
}

bool ADCache::IsDomainMember() const {
  const MutexLock lock(lock_);
  return !domain_.dnsName.empty();
}

TrustRelationship ADCache::GetDomainTrustRelationship(const std::string& domain) const {
  const MutexLock lock(lock_);
  const auto entry = trustRelationships_.find(domain);
  return entry == trustRelationships_.end() ? TRUST_RELATIONSHIP_UNKNOWN : entry->second.first;
}

void ADCache::SetDomainTrustRelationship(const std::string& domain, TrustRelationship relationship) {
  const MutexLock lock(lock_);
  trustRelationships_[domain] = {relationship, trustRelationshipsGeneration_};
}

void ADCache::IncreaseTrustRelationshipsGenNo() {
  const MutexLock lock(lock_);
  ++trustRelationshipsGeneration_;
}

void ADCache::CleanupOldTrustRelationships() {
  const MutexLock lock(lock_);
  for (auto entry = trustRelationships_.begin(); entry != trustRelationships_.end();) {
    const bool current = entry->second.second == trustRelationshipsGeneration_;
    entry = current ? std::next(entry) : trustRelationships_.erase(entry);
  }
}

void ADCache::SetSmartCardEnabledServices(const std::vector<std::string>& services) {
  const MutexLock lock(lock_);
  smartCardEnabledServices_ = services;
}

bool ADCache::IsSmartCardAuthenticationEnabled(const char* const* services, std::size_t count) const {
  const MutexLock lock(lock_);
  if (!pcscdSvcPolicyOn_) return false;
  return ContainsAll(smartCardEnabledServices_, services, count);
}

void ADCache::SetPcscdSvcPolicyOn(bool on) {
  const MutexLock lock(lock_);
  pcscdSvcPolicyOn_ = on;
}

}  // namespace quenix::authentication
