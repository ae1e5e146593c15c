#ifndef KERNCTL_DNS_CONFIG_H
#define KERNCTL_DNS_CONFIG_H

#include <string>
#include <vector>

#include "hostmgmt/export.h"

namespace KernCtl::Network {

/// The DNS resolver configuration of a network stack, for editing. An object belongs to one thread at a
/// time; several objects, in one or several processes, save one after the other.
///
/// The configuration is /etc/resolv.conf or, where that is a link into the directory of systemd-resolved or
/// resolvconf, the configuration from which that service makes it.
class HOSTMGMT_EXPORT DnsConfigImpl {
 public:
  /// Opens the configuration of the stack; the host has one, "defaultTcpipStack".
  /// Throws HostMgmt::Lib::HostMgmtException for any other name, and when the configuration cannot be read.
  explicit DnsConfigImpl(const std::string& stackName);
  ~DnsConfigImpl();
  DnsConfigImpl(const DnsConfigImpl&) = delete;
  DnsConfigImpl& operator=(const DnsConfigImpl&) = delete;

  /// Notes the domain as one more search domain; nothing is changed before SaveConfig.
  /// Throws HostMgmt::Lib::HostMgmtException when the text cannot be a domain name.
  void AddUserSearchDomain(const std::string& domain);

  /// Adds the noted domains behind the search domains that are configured at the time of the call, leaving
  /// out those that are (compared without regard to letter case and a trailing dot), stores the
  /// configuration durably and has its owner apply it. Changes nothing when nothing is to be added. Waits
  /// at most ten seconds for another process's edit, and at most thirty for the owner.
  /// Throws HostMgmt::Lib::HostMgmtException when the configuration cannot be read or written (it is then as
  /// it was), and when its owner fails to apply it (it is then stored, and the next SaveConfig of the same
  /// domain asks the owner again).
  void SaveConfig();

 private:
  std::vector<std::string> addedDomains_;
};

}  // namespace KernCtl::Network

#endif
