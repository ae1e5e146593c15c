#ifndef KERNCTL_NETWORK_INFO_H
#define KERNCTL_NETWORK_INFO_H

#include <memory>
#include <string>

#include "hostmgmt/export.h"
#include "hostmgmt/ip_config.h"

namespace KernCtl::Network {

/// One network interface of the host.
class HOSTMGMT_EXPORT NetworkInterface {
 public:
  virtual ~NetworkInterface();

  /// The interface's name, for example "eth0".
  virtual std::string GetName() const = 0;

  /// The interface's IP configuration at the time of the call. Throws HostMgmt::Lib::HostMgmtException when
  /// the interface has no IPv4 address (any more) or the system cannot be asked.
  virtual HostMgmt::Network::IpConfig GetIpConfig() = 0;

 protected:
  NetworkInterface();
  NetworkInterface(const NetworkInterface&) = delete;
  NetworkInterface& operator=(const NetworkInterface&) = delete;
};

/// The host's network interfaces. Keeps no state: each question is answered from the system, so it may be
/// asked on any thread.
class HOSTMGMT_EXPORT NetworkInfoImpl {
 public:
  /// Throws HostMgmt::Lib::HostMgmtException when the system does not give its interfaces.
  NetworkInfoImpl();
  NetworkInfoImpl(const NetworkInfoImpl&) = delete;
  NetworkInfoImpl& operator=(const NetworkInfoImpl&) = delete;

  /// The host's management interface, owned by the caller: the one that the advanced option
  /// "Net.ManagementInterface" names; else the one of the IPv4 default route with the lowest metric; else
  /// the first one, by interface index, that is up with an IPv4 address that is not loopback.
  /// Throws HostMgmt::Lib::HostMgmtException when the named interface does not exist, is down or has no
  /// IPv4 address, when the options cannot be read, and when no interface fits.
  std::unique_ptr<NetworkInterface> GetManagementInterface();
};

}  // namespace KernCtl::Network

#endif
