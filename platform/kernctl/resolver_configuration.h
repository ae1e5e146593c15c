#ifndef PLATFORM_KERNCTL_RESOLVER_CONFIGURATION_H
#define PLATFORM_KERNCTL_RESOLVER_CONFIGURATION_H

#include <memory>

#include "kernctl/search_list.h"

namespace KernCtl::Network {

constexpr char kResolvConfPath[] = "/etc/resolv.conf";

/// The configuration that decides about the resolver's search list, whoever owns it. Reads its files anew
/// in each operation. Failures are HostMgmt::Lib::HostMgmtException.
class ResolverConfiguration {
 public:
  virtual ~ResolverConfiguration() = default;

  /// The search domains that are configured.
  virtual DomainList GetSearchDomains() const = 0;

  /// Stores the domains, which are not configured yet, behind those that are.
  virtual void AddSearchDomains(const DomainList& domains) = 0;

  /// Has the owner make /etc/resolv.conf anew, when it is at work.
  virtual void Apply() = 0;
};

/// The configuration of this host, by what /etc/resolv.conf is.
std::unique_ptr<ResolverConfiguration> OpenResolverConfiguration();

std::unique_ptr<ResolverConfiguration> MakePlainResolver();
std::unique_ptr<ResolverConfiguration> MakeResolvconfResolver();
std::unique_ptr<ResolverConfiguration> MakeSystemdResolver();

/// The search list in force, from /etc/resolv.conf.
DomainList SearchListInForce();

/// The domain that the resolver searches while no search list is set: the host name's own.
DomainList ImplicitSearchList();

}  // namespace KernCtl::Network

#endif
