#ifndef HOSTMGMT_IP_CONFIG_H
#define HOSTMGMT_IP_CONFIG_H

#include <string>

#include "hostmgmt/export.h"

namespace HostMgmt::Network {

/// An IPv4 address. A value: copies are independent, and one object may be read from several threads.
class HOSTMGMT_EXPORT Ipv4Address {
 public:
  /// Throws Lib::HostMgmtException when `address` is not a valid address (see IsValidAddress).
  explicit Ipv4Address(const std::string& address);

  /// Tells whether the text is an IPv4 address in dotted-decimal form: four decimal numbers from 0 to 255
  /// without leading zeros, and nothing before or after them.
  static bool IsValidAddress(std::string const& address);

  /// The address in dotted-decimal form.
  std::string GetStringAddress() const;

 private:
  std::string address_;
};

/// The IP settings of one network interface at the moment of the question. A value, as Ipv4Address.
class HOSTMGMT_EXPORT IpConfig {
 public:
  explicit IpConfig(const Ipv4Address& ipv4Address);

  /// The interface's primary IPv4 address.
  Ipv4Address GetIpv4Address() const;

 private:
  Ipv4Address ipv4Address_;
};

}  // namespace HostMgmt::Network

#endif
