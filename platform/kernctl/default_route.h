#ifndef PLATFORM_KERNCTL_DEFAULT_ROUTE_H
#define PLATFORM_KERNCTL_DEFAULT_ROUTE_H

#include <string>
#include <vector>

namespace KernCtl::Network {

/// The names of the interfaces of the IPv4 default routes that are up, the one with the lowest metric first.
/// Throws HostMgmt::Lib::HostMgmtException when the kernel's table cannot be read.
std::vector<std::string> DefaultRouteInterfaces();

}  // namespace KernCtl::Network

#endif
