#include "kernctl/dns_config.h"

#include <algorithm>
#include <cstddef>

#include "hostmgmt/host_management_exception.h"
#include "kernctl/resolver_configuration.h"
#include "system/edit_lock.h"

namespace KernCtl::Network {
namespace {

constexpr char kStackName[] = "defaultTcpipStack";
constexpr std::size_t kLongestName = 254;  // with a trailing dot

bool IsDomainName(const std::string& text) {
  if (text.empty() || text.size() > kLongestName || text.front() == '.' || text.front() == '-') return false;
  if (text.find("..") != std::string::npos) return false;
  return std::all_of(text.begin(), text.end(), [](char character) {
    return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
           (character >= '0' && character <= '9') || character == '-' || character == '_' ||
           character == '.' || static_cast<unsigned char>(character) >= 0x80;
  });
}

}  // namespace

DnsConfigImpl::DnsConfigImpl(const std::string& stackName) {
  if (stackName != kStackName) {
    throw HostMgmt::Lib::HostMgmtException("The host has no network stack '" + stackName + "'");
  }
  OpenResolverConfiguration()->GetSearchDomains();
}

DnsConfigImpl::~DnsConfigImpl() = default;

void DnsConfigImpl::AddUserSearchDomain(const std::string& domain) {
  if (!IsDomainName(domain)) {
    throw HostMgmt::Lib::HostMgmtException("'" + domain + "' cannot be a DNS search domain");
  }
  addedDomains_.push_back(domain);
}

void DnsConfigImpl::SaveConfig() {
  if (addedDomains_.empty()) return;
  const HostMgmt::System::EditLock lock("resolver", kResolvConfPath);
  const auto configuration = OpenResolverConfiguration();
  const DomainList missing = MissingDomains(addedDomains_, configuration->GetSearchDomains());
  if (!missing.empty()) configuration->AddSearchDomains(missing);
  // An owner that failed to apply an earlier change is asked again, although the change itself is stored.
  const bool inForce = MissingDomains(addedDomains_, SearchListInForce()).empty();
  if (!missing.empty() || !inForce) configuration->Apply();
}

}  // namespace KernCtl::Network
