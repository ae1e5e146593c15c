#include "authentication/directory_records.h"

#include <ostream>

namespace quenix::authentication {

namespace {

const std::string& NameOrUnset(const std::string& name) {
  static const std::string unset = "(unset)";
  return name.empty() ? unset : name;
}

}  // namespace

Domain::Domain(const std::string& dns, const std::string& netbios) : dnsName(dns), netbiosName(netbios) {}

std::ostream& operator<<(std::ostream& stream, const Domain& domain) {
  return stream << "DNS Name: " << NameOrUnset(domain.dnsName)
                << ", NetBIOS Name: " << NameOrUnset(domain.netbiosName);
}

ActiveDirectoryStoreConfiguration::~ActiveDirectoryStoreConfiguration() = default;

}  // namespace quenix::authentication
