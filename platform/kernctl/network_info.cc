#include "kernctl/network_info.h"

#include <algorithm>
#include <string>
#include <vector>

#include "hostmgmt/host.h"
#include "hostmgmt/host_management_exception.h"
#include "kernctl/default_route.h"
#include "kernctl/interface_table.h"

namespace KernCtl::Network {
namespace {

using HostMgmt::Lib::HostMgmtException;

class NetworkInterfaceImpl : public NetworkInterface {
 public:
  explicit NetworkInterfaceImpl(const std::string& name) : name_(name) {}

  std::string GetName() const override { return name_; }

  HostMgmt::Network::IpConfig GetIpConfig() override {
    const std::vector<InterfaceState> interfaces = ReadInterfaces();
    const auto found = FindInterface(interfaces, name_);
    if (found == interfaces.end() || found->ipv4Address.empty()) {
      throw HostMgmtException("The network interface '" + name_ + "' has no IPv4 address");
    }
    return HostMgmt::Network::IpConfig(HostMgmt::Network::Ipv4Address(found->ipv4Address));
  }

 private:
  std::string name_;
};

/// The name that the host's options give the management interface; empty when they give none.
std::string ConfiguredName() {
  const auto root = HostMgmt::HostFactory::GetHost()->GetAdvancedOptions();
  const auto branch = root ? root->GetChild("Net") : nullptr;
  const auto option = branch ? branch->GetOption("ManagementInterface") : nullptr;
  const auto text = std::dynamic_pointer_cast<const HostMgmt::Adv::AdvancedStringOption>(option);
  if (option && !text) {
    throw HostMgmtException("The advanced option 'Net.ManagementInterface' is not the name of an interface");
  }
  return text ? text->GetValue() : "";
}

void RequireUsable(const std::vector<InterfaceState>& interfaces, const std::string& name) {
  const std::string subject =
      "The network interface '" + name + "', which the advanced option 'Net.ManagementInterface' names, ";
  const auto found = FindInterface(interfaces, name);
  if (found == interfaces.end()) throw HostMgmtException(subject + "does not exist");
  if (!found->isUp) throw HostMgmtException(subject + "is down");
  if (found->ipv4Address.empty()) throw HostMgmtException(subject + "has no IPv4 address");
}

bool CanServe(const InterfaceState& interface) {
  return interface.isUp && !interface.isLoopback && !interface.ipv4Address.empty() &&
         interface.ipv4Address.compare(0, 4, "127.") != 0;
}

std::string ChooseName(const std::vector<InterfaceState>& interfaces) {
  for (const std::string& name : DefaultRouteInterfaces()) {
    const auto found = FindInterface(interfaces, name);
    if (found != interfaces.end() && CanServe(*found)) return name;
  }
  const auto first = std::find_if(interfaces.begin(), interfaces.end(), CanServe);
  if (first == interfaces.end()) {
    throw HostMgmtException(
        "The host has no management interface: no network interface is up with an IPv4 address");
  }
  return first->name;
}

}  // namespace

NetworkInterface::NetworkInterface() = default;
NetworkInterface::~NetworkInterface() = default;

NetworkInfoImpl::NetworkInfoImpl() {
  ReadInterfaces();
}

std::unique_ptr<NetworkInterface> NetworkInfoImpl::GetManagementInterface() {
  const std::vector<InterfaceState> interfaces = ReadInterfaces();
  std::string name = ConfiguredName();
  if (name.empty()) {
    name = ChooseName(interfaces);
  } else {
    RequireUsable(interfaces, name);
  }
  return std::make_unique<NetworkInterfaceImpl>(name);
}

}  // namespace KernCtl::Network
