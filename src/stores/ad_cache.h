/// The last known answers about the host's standing in the directory.
#ifndef STORES_AD_CACHE_H
#define STORES_AD_CACHE_H

#include <cstddef>
#include <cstdint>
#include <deque>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "authentication/directory_records.h"
#include "errors/mutex.h"

namespace quenix::authentication {

/// A cache for all threads of the process. Every operation holds the cache's lock for its whole length, works
/// on copies and calls nothing outside of the cache.
class ADCache {
 public:
  /// The joined domain, the preferred domain controllers and the machine account's distinguished name.
  ActiveDirectoryStoreConfiguration GetConfiguration() const;
  void SetConfiguration(ActiveDirectoryStoreConfiguration&& configuration);

  std::deque<Domain> GetTrustedDomains() const;
  void SetTrustedDomains(std::deque<Domain>&& domains);

  /// The joined domain, even when its names are empty, and then the trusted ones.
  std::vector<Domain> GetAllDomains() const;

  TrustState GetDomainTrustState() const;
  void SetDomainTrustState(TrustState state);

  /// Whether the host has joined a domain.
  bool IsDomainMember() const;

  /// TRUST_RELATIONSHIP_UNKNOWN for a domain of which nothing is known.
  TrustRelationship GetDomainTrustRelationship(const std::string& domain) const;

  /// Stores a relationship as one of the current refresh pass.
  void SetDomainTrustRelationship(const std::string& domain, TrustRelationship relationship);

  /// Begins a refresh pass. *Deliberate:* passes are counted in eight bits, so one that is 256 passes old
  /// counts as current.
  void IncreaseTrustRelationshipsGenNo();

  /// Drops every relationship that was not stored in the current pass.
  void CleanupOldTrustRelationships();

  void SetSmartCardEnabledServices(const std::vector<std::string>& services);

  /// Whether the smart-card daemon's policy is on and each of the `count` services is enabled.
  bool IsSmartCardAuthenticationEnabled(const char* const* services, std::size_t count) const;
  void SetPcscdSvcPolicyOn(bool on);

 private:
  mutable Mutex lock_;
  Domain domain_ VELMOR_GUARDED_BY(lock_);
  std::deque<std::string> preferredDomainControllers_ VELMOR_GUARDED_BY(lock_);
  std::string machineAccountDN_ VELMOR_GUARDED_BY(lock_);
  TrustState trustState_ VELMOR_GUARDED_BY(lock_) = TRUST_STATE_NOT_KNOWN;
  bool pcscdSvcPolicyOn_ VELMOR_GUARDED_BY(lock_) = false;
  std::vector<std::string> smartCardEnabledServices_ VELMOR_GUARDED_BY(lock_);
  std::deque<Domain> trustedDomains_ VELMOR_GUARDED_BY(lock_);
  std::uint8_t trustRelationshipsGeneration_ VELMOR_GUARDED_BY(lock_) = 0;
  std::unordered_map<std::string, std::pair<TrustRelationship, std::uint8_t>> trustRelationships_
      VELMOR_GUARDED_BY(lock_);
};

}  // namespace quenix::authentication

#endif  // STORES_AD_CACHE_H
