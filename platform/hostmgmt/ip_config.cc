#include "hostmgmt/ip_config.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include "hostmgmt/host_management_exception.h"

namespace HostMgmt::Network {

Ipv4Address::Ipv4Address(const std::string& address) : address_(address) {
  if (!IsValidAddress(address)) throw Lib::HostMgmtException("'" + address + "' is not an IPv4 address");
}

bool Ipv4Address::IsValidAddress(std::string const& address) {
  if (address.find('\0') != std::string::npos) return false;
  in_addr parsed{};
  return inet_pton(AF_INET, address.c_str(), &parsed) == 1;
}

std::string Ipv4Address::GetStringAddress() const {
  return address_;
}

IpConfig::IpConfig(const Ipv4Address& ipv4Address) : ipv4Address_(ipv4Address) {}

Ipv4Address IpConfig::GetIpv4Address() const {
  return ipv4Address_;
}

}  // namespace HostMgmt::Network
