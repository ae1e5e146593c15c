/// The host's identity records in the host configuration store.
#ifndef AUTHENTICATION_ACTIVE_DIRECTORY_CONFIG_STORE_H
#define AUTHENTICATION_ACTIVE_DIRECTORY_CONFIG_STORE_H

#include <memory>
#include <string>

#include "authentication/export.h"
#include "orvconfigstore/config_store.h"

namespace quenix::authentication {

/// Publishes the join in the configuration store that other host services read, and keeps the CAM proxy's
/// certificate there. Cheap to create: make one for each use, on one thread.
///
/// Every operation throws OrvConfigStore::ConfigStoreException as the configuration store throws it.
class VELMOR_EXPORT ActiveDirectoryConfigStore {
 public:
  static const OrvConfigStore::ConfigStoreObjectId AD_CSO_ID;
  static const OrvConfigStore::ConfigStoreObjectId AUTH_PROXY_CERT_CSO_ID;

  /// Opens the configuration store.
  ActiveDirectoryConfigStore();

  /// The joined domain's name, its organizational unit and the proxy that the join went through; empty when
  /// that field was not stored. Throw ConfigurationError when there is no record of a join.
  std::string GetDomainName();
  std::string GetOrganizationalUnit();
  std::string GetAuthProxyAddr();

  /// The CAM proxy's certificate and its thumbprint. Throw ConfigurationError when none was stored.
  std::string GetCertificate();
  std::string GetThumbprint();

  /// One field of one record; empty when the record lacks it. Throws ConfigurationError when there is no
  /// record.
  std::string GetStringValue(const OrvConfigStore::ConfigStoreObjectId& id, const std::string& field);

  /// Replaces the record of the join. An empty organizational unit leaves no such field, even if there was
  /// one.
  void StoreDomainInfo(const std::string& domainName, const std::string& organizationalUnit,
                       const std::string& authProxyAddress);

  /// Replaces the record of the CAM proxy's certificate.
  void StoreAuthProxyCertInfo(const std::string& thumbprint, const std::string& certificate);

  /// Removes the record of the join, if there is one. The proxy's certificate stays.
  void RemoveDomainInfo();

 private:
  std::shared_ptr<OrvConfigStore::ConfigStore> store_;
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_ACTIVE_DIRECTORY_CONFIG_STORE_H
