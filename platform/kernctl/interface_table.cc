#include "kernctl/interface_table.h"

#include <arpa/inet.h>
#include <ifaddrs.h>
#include <net/if.h>
#include <netinet/in.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <memory>

#include "hostmgmt/host_management_exception.h"
#include "system/system_error.h"

namespace KernCtl::Network {
namespace {

using AddressList = std::unique_ptr<ifaddrs, decltype(&freeifaddrs)>;

AddressList ReadAddresses() {
  ifaddrs* first = nullptr;
  if (getifaddrs(&first) != 0) {
    throw HostMgmt::Lib::HostMgmtException("Unable to read the network interfaces: " +
                                           HostMgmt::System::ErrorText(errno));
  }
  return AddressList(first, &freeifaddrs);
}

std::string Ipv4Text(const sockaddr* address) {
  sockaddr_in ipv4{};
  std::memcpy(&ipv4, address, sizeof(ipv4));
  char text[INET_ADDRSTRLEN];
  return inet_ntop(AF_INET, &ipv4.sin_addr, text, sizeof(text));
}

bool IsIpv4(const ifaddrs& entry) {
  return entry.ifa_addr != nullptr && entry.ifa_addr->sa_family == AF_INET;
}

/// The name of an address's entry is its label, which may carry a suffix behind a colon ("eth0:1").
std::string InterfaceName(const ifaddrs& entry) {
  const std::string label = entry.ifa_name;
  return label.substr(0, label.find(':'));
}

InterfaceState& FindOrAdd(std::vector<InterfaceState>* interfaces, const ifaddrs& entry) {
  const std::string name = InterfaceName(entry);
  const auto found = std::find_if(interfaces->begin(), interfaces->end(),
                                  [&name](const InterfaceState& known) { return known.name == name; });
  if (found != interfaces->end()) return *found;
  InterfaceState state;
  state.index = if_nametoindex(name.c_str());
  state.name = name;
  state.isUp = (entry.ifa_flags & IFF_UP) != 0;
  state.isLoopback = (entry.ifa_flags & IFF_LOOPBACK) != 0;
  interfaces->push_back(state);
  return interfaces->back();
}

}  // namespace

std::vector<InterfaceState> ReadInterfaces() {
  const AddressList addresses = ReadAddresses();
  std::vector<InterfaceState> interfaces;
  for (const ifaddrs* entry = addresses.get(); entry != nullptr; entry = entry->ifa_next) {
    InterfaceState& state = FindOrAdd(&interfaces, *entry);
    if (IsIpv4(*entry) && state.ipv4Address.empty()) state.ipv4Address = Ipv4Text(entry->ifa_addr);
  }
  std::stable_sort(
      interfaces.begin(), interfaces.end(),
      [](const InterfaceState& left, const InterfaceState& right) { return left.index < right.index; });
  return interfaces;
}

std::vector<InterfaceState>::const_iterator FindInterface(const std::vector<InterfaceState>& interfaces,
                                                          const std::string& name) {
  return std::find_if(interfaces.begin(), interfaces.end(),
                      [&name](const InterfaceState& interface) { return interface.name == name; });
}

}  // namespace KernCtl::Network
