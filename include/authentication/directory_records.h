/// The records that pass between the Active Directory store, its callers and the plug-ins. Plain values; an
/// empty text means that something is not known or not set. `Credentials`, `TrustState` and
/// `TrustRelationship`, which cross into the provider plug-in, are declared in its own header.
#ifndef AUTHENTICATION_DIRECTORY_RECORDS_H
#define AUTHENTICATION_DIRECTORY_RECORDS_H

#include <deque>
#include <iosfwd>
#include <string>

#include "authentication/export.h"
#include "authentication/plugin/active_directory_client.h"
#include "authentication/store.h"

namespace quenix::authentication {

/// A domain as the directory names it.
struct VELMOR_EXPORT Domain {
  Domain() = default;
  Domain(const std::string& dnsName, const std::string& netbiosName);

  std::string dnsName;
  std::string netbiosName;
};

/// Writes "DNS Name: X, NetBIOS Name: Y" without a line end, "(unset)" standing for an empty name.
VELMOR_EXPORT std::ostream& operator<<(std::ostream& stream, const Domain& domain);

/// What the host knows of its place in the directory.
class VELMOR_EXPORT ActiveDirectoryStoreConfiguration : public StoreConfiguration {
 public:
  ActiveDirectoryStoreConfiguration() = default;
  ActiveDirectoryStoreConfiguration(const ActiveDirectoryStoreConfiguration&) = default;
  ActiveDirectoryStoreConfiguration(ActiveDirectoryStoreConfiguration&&) = default;
  ActiveDirectoryStoreConfiguration& operator=(const ActiveDirectoryStoreConfiguration&) = default;
  ActiveDirectoryStoreConfiguration& operator=(ActiveDirectoryStoreConfiguration&&) = default;
  ~ActiveDirectoryStoreConfiguration() override;

  Domain activeDomain;                                 /// the joined domain; both names empty when not joined
  std::deque<std::string> preferredDomainControllers;  /// in the plug-in's order
  std::string machineAccountDN;                        /// distinguished name of the host's computer account
};

namespace CAM {

/// The domain of a join through the CAM proxy.
struct VELMOR_EXPORT DirectoryDomainInfo {
  std::string domainController;  /// not filled by the library; crosses to the plug-in empty
  std::string netbiosDomainName;
  std::string dnsDomainName;
  std::string domainSid;  /// in its text form
};

/// The host's computer account that the CAM proxy made.
struct VELMOR_EXPORT MachineAccountInfo {
  std::string hostName;  /// the host's short name
  std::string dnsDomainName;
  std::string organizationalUnit;  /// not filled by the library; crosses to the plug-in empty
  std::string accountName;
  std::string joinBlob;  /// a secret
};

}  // namespace CAM

/// What the CAM proxy returns when it has made a computer account.
struct VELMOR_EXPORT ComputerPrincipalInfo {
  std::string organizationalUnit;  /// not filled by the library
  std::string accountName;
  std::string joinBlob;  /// a secret
};

}  // namespace quenix::authentication

#endif  // AUTHENTICATION_DIRECTORY_RECORDS_H
