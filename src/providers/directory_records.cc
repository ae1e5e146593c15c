#include "authentication/directory_records.h"

#include <ostream>
#include <string_view>

namespace quenix::authentication {

namespace {

std::string_view NameOrUnset(const std::string& name) {
  return name.empty() ? "(unset)" : std::string_view(name);
}

}  // namespace

Domain::Domain(const std::string& dns, const std::string& netbios) : dnsName(dns), netbiosName(netbios) {}

std::ostream& operator<<(std::ostream& stream, const Domain& domain) {
  return stream << "DNS Name: " << NameOrUnset(domain.dnsName)
                << ", NetBIOS Name: " << NameOrUnset(domain.netbiosName);
}

ActiveDirectoryStoreConfiguration::~ActiveDirectoryStoreConfiguration() = default;

}  // namespace quenix::authentication
