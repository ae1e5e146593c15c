#ifndef PLATFORM_KERNCTL_INTERFACE_TABLE_H
#define PLATFORM_KERNCTL_INTERFACE_TABLE_H

#include <string>
#include <vector>

namespace KernCtl::Network {

/// A network interface as the kernel has it at one moment.
struct InterfaceState {
  unsigned int index = 0;
  std::string name;
  bool isUp = false;
  bool isLoopback = false;
  /// The first one, in dotted-decimal form; empty when there is none.
  std::string ipv4Address;
};

/// The interfaces by index. Throws HostMgmt::Lib::HostMgmtException when the system does not give them.
std::vector<InterfaceState> ReadInterfaces();

/// The interface of that name, or the end of the list.
std::vector<InterfaceState>::const_iterator FindInterface(const std::vector<InterfaceState>& interfaces,
                                                          const std::string& name);

}  // namespace KernCtl::Network

#endif
