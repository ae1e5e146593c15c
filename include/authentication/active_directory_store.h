/// The store "Active Directory".
#ifndef AUTHENTICATION_ACTIVE_DIRECTORY_STORE_H
#define AUTHENTICATION_ACTIVE_DIRECTORY_STORE_H

#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "authentication/directory_records.h"
#include "authentication/exception.h"
#include "authentication/export.h"
#include "authentication/store.h"
#include "authentication/thread_annotations.h"

namespace quenix::authentication {

class ActiveDirectoryProvider;
class ADCache;
class Mutex;
class RequestState;

/// Joins the host to an Active Directory domain, leaves it, and answers questions about it.
///
/// May be used from several threads at once, but one join or leave at a time is the caller's affair.
///
/// The status questions (GetStoreConfiguration, GetTrustedDomains, GetDomainTrustState,
/// GetDomainTrustRelationship) ask the provider plug-in on a thread of their own and wait for it no longer
/// than the store's time-out; then they log a warning and answer from the process-wide cache, while the call
/// runs on and refreshes the cache at its end. Callers that ask the same at once share one call. A failure of
/// the call is thrown to each of them; ThreadErrorException says that no thread could be started or waited
/// for. All other operations last as long as the plug-in takes and throw the exception of its status.
class VELMOR_EXPORT ActiveDirectoryStore : public DirectoryStore {
 public:
  /// Loads the provider plug-in that ProviderConfiguration names. The factory's stores wait 60 seconds.
  /// Throws InvalidActiveDirectoryProviderException for "(none installed)" when that file cannot be read, for
  /// "(unset)" when it names no provider, and for the provider's name when it cannot be loaded or used; and
  /// ConfigurationError when the file is malformed.
  explicit ActiveDirectoryStore(int requestTimeoutSeconds);

  /// A question; returns a new ActiveDirectoryStoreConfiguration, owned by the caller. Pieces that the
  /// plug-in cannot give are empty.
  std::unique_ptr<StoreConfiguration> GetStoreConfiguration() const override;

  /// "Active Directory".
  std::string GetDisplayName() const override;

  /// Records this store as the active one and refreshes the cache as UpdateCache() does. *Deliberate:* it
  /// writes even if it is recorded already, and does not deactivate the store that was active before.
  /// Throws what reading and writing AuthenticationConfiguration throws, and InvalidKeyException when it has
  /// no "remote-authentication-store".
  void MakeActive() override;

  ~ActiveDirectoryStore() override;

  /// Refreshes the cache as UpdateCache() does; writes nothing.
  void MakeInactive() override;

  /// Joins the host to `domain`: a DNS name, or that and, behind the first "/", the organizational unit for
  /// the computer account. Makes the host's name resolvable in the domain first, unless `skipHostnameCheck`.
  /// Lasts up to two minutes longer than the plug-in's own calls, since an attempt that may cure itself is
  /// repeated.
  ///
  /// Throws InvalidCredentialsException without a user name or a password; InvalidHostNameException when the
  /// host's name cannot be used; what the platform throws when host files cannot be edited; the exception of
  /// the plug-in's status; and OrvConfigStore::ConfigStoreException when the join could not be recorded, in
  /// which case the host has left the domain again.
  void JoinDomain(const std::string& domain, const Credentials& credentials, bool skipHostnameCheck);

  /// The DNS name of the domain that the CAM server at this IPv4 address serves. *Deliberate:* never verifies
  /// the server's certificate, since it is asked before anybody could trust one. Throws
  /// InvalidIPAddressException; InvalidCAMProxyProviderException for "(none installed)", "(unset)" or a
  /// plug-in that cannot be used; IOError when the plug-in cannot be loaded; and the exception of its status.
  std::string GetDomainForCAMService(const std::string& camServer);

  /// Stores the certificate that joins through the CAM proxy expect of the server, a PEM text.
  /// Throws InvalidCertificateException, or OrvConfigStore::ConfigStoreException when it cannot be stored.
  void ImportCertificateForCAM(const std::string& certificate);

  /// As above with the text of the file at `path`; the second argument is not used. Throws
  /// FileNotFoundException when the file cannot be opened, and IOError when it cannot be read.
  void ImportCertificateForCAM(const std::string& path, const std::string& unused);

  /// Joins the host with a computer account that the CAM server creates in `container`, or in the directory's
  /// default place when that is empty. Whether the server's certificate must be the imported one is the
  /// host's option "UserVars.ActiveDirectoryVerifyCAMCertificate".
  ///
  /// Throws InvalidIPAddressException, InvalidVerifyCAMCertificateOptionException, InvalidHostNameException,
  /// InvalidCAMProxyProviderException, InvalidThumbprintStoreException, IOError and the exceptions of the two
  /// plug-ins' statuses; the host is then not joined, though an account that was created stays. What
  /// recording the join throws goes out after the host has left the domain again.
  void JoinDomainWithCAM(const std::string& camServer, const std::string& container, bool skipHostnameCheck);

  /// Leaves the domain without an account and removes the record of the join.
  /// Throws the exception of the plug-in's status, or OrvConfigStore::ConfigStoreException, in which case the
  /// host has left but the record is still there.
  void PartDomain();

  /// Leaves the domain with an account that may remove the computer account. *Deliberate:* unlike
  /// PartDomain(), it leaves the record of the join alone. Throws the exception of the plug-in's status.
  void PartDomain(const Credentials& credentials);

  /// The domain controller to use for `domain`; empty when the plug-in has no such operation.
  std::string GetDomainControllerForDomain(const std::string& domain) const;

  /// The host's service principal in `domain`; empty when the plug-in has no such operation.
  std::string GetHostPrincipalForDomain(const std::string& domain) const;

  /// The one form of a user's name; `name` itself when the plug-in has no such operation.
  std::string ConvertCanonicalUsername(const std::string& name) const;

  /// Sets the domain controllers to use first. Only logs a warning when the plug-in has no such operation.
  void SetPreferredDomainControllers(const std::deque<std::string>& controllers);

  /// The services that may authenticate with a smart card.
  std::vector<std::string> GetSmartCardEnabledServices() const;

  /// Sets them, in the plug-in and then in the cache.
  void SetSmartCardEnabledServices(const std::vector<std::string>& services) const;

  /// A question: the domains that the joined one trusts, in the plug-in's order.
  std::deque<Domain> GetTrustedDomains() const;

  /// A question: the state of the trust with the joined domain. Asks GetTrustedDomains() first, with a wait
  /// of its own; when the plug-in misses a file there, the answer is TRUST_STATE_NOT_KNOWN. *Deliberate:*
  /// when the trust state itself is late, the answer is TRUST_STATE_TIMED_OUT and the cache holds that too,
  /// since an old "healthy" would hide the trouble.
  TrustState GetDomainTrustState() const;

  /// A question: how the joined domain and the one of that DNS name trust each other.
  TrustRelationship GetDomainTrustRelationship(const std::string& domain) const;

  /// Ask the plug-in and store the answer in the cache; false, and an error in the log, when that fails.
  bool FetchAdConfig();
  bool FetchDomainTrustState();
  bool FetchTrustedDomains();
  bool FetchTrustRelationships();
  bool FetchScEnabledSvcs();

  /// Refreshes the whole cache, and sets whether the smart-card daemon's policy is on when a value is given.
  /// Lasts up to one time-out for each question, and as long as the plug-in takes for the smart-card
  /// services. Failures are logged; only what is no Exception, from the host's scheduler or out of a plug-in,
  /// is thrown.
  void UpdateCache(std::optional<bool> pcscdServicePolicy);

  /// Makes sure that the host's name can be used as a computer name in `domain`: adds the domain to the DNS
  /// search list when the host's full name lies outside it, and enters the management address into the hosts
  /// file. Throws InvalidHostNameException, or what the platform throws; what was changed by then stays.
  void SanitiseHostnameForDomain(const std::string& domain) const;

 protected:
  using Provider = std::shared_ptr<ActiveDirectoryProvider>;

  /// Starts `work` for `key` unless a request of that key runs; returns that request. What a scheduler throws
  /// goes to the caller, and the work does not run, even if the scheduler has kept it.
  static std::shared_ptr<RequestState> StartOrAttachToRequest(const std::string& key,
                                                              std::function<void(const std::string&)> work);
  /// Ends the request of `key`, if there is one, for all who wait for it; a null `failure` is success.
  static void FinishRequest(const std::string& key, std::unique_ptr<Exception>&& failure);

  /// What a request's thread runs: ask the provider, store the answer in the cache, finish the request.
  static void GetStoreConfigurationInt(Provider provider, const std::string& key);
  static void GetTrustedDomainsInt(Provider provider, const std::string& key);
  static void GetDomainTrustStateInt(Provider provider, const std::string& key);
  static void GetDomainTrustRelationshipInt(Provider provider, const std::string& key,
                                            const std::string& domain);

  /// The state that all stores of the process share. `_lock` guards `_asyncRequests` and is taken before the
  /// lock of a RequestState; the cache has a lock of its own, under which nothing else is called.
  static ADCache& _adCache;
  static Mutex& _lock;
  static std::unordered_map<std::string, std::shared_ptr<RequestState>>& _asyncRequests
      VELMOR_GUARDED_BY(_lock);

 private:
  std::int32_t requestTimeoutSeconds_;
  Provider provider_;
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_ACTIVE_DIRECTORY_STORE_H
