#include <netdb.h>
#include <syslog.h>

#include <algorithm>
#include <array>
#include <locale>
#include <string_view>

#include "authentication/active_directory_store.h"
#include "authentication/library_exceptions.h"
#include "kernctl/network.h"
#include "stores/host_name.h"

namespace quenix::authentication {

namespace {

/// Names that hosts have before anybody gives them one; two such hosts would take each other's account.
constexpr std::array<std::string_view, 3> nameBlacklist{"localhost", "linux", "hostname"};

bool EqualWithoutCase(const std::string& left, const std::string& right) {
  const std::locale locale;
  return std::equal(left.begin(), left.end(), right.begin(), right.end(),
                    [&locale](char a, char b) { return std::toupper(a, locale) == std::toupper(b, locale); });
}

/// Lets the host find names in `domain`, if there is such a domain.
void AddSearchDomain(const std::string& domain) {
  if (gethostbyname(domain.c_str()) == nullptr) return;
  KernCtl::Network::DnsConfigImpl dnsConfiguration("defaultTcpipStack");
  dnsConfiguration.AddUserSearchDomain(domain);
  dnsConfiguration.SaveConfig();
}

}  // namespace

void ActiveDirectoryStore::SanitiseHostnameForDomain(const std::string& domain) const {
  KernCtl::Network::HostsFile hostsFile;
  KernCtl::Network::NetworkInfoImpl networkInfo;

  const std::string hostName = LocalHostName();
  std::string fullName = CanonicalHostName(hostName);
  const std::string shortName = FirstLabel(hostName);
  if (FirstLabel(fullName) != shortName) throw InvalidHostNameException("shortname does not match FQDN");

  const std::string expectedName = shortName + "." + domain;
  if (fullName.find('.') == std::string::npos) fullName = expectedName;
  if (!EqualWithoutCase(fullName, expectedName)) {
    syslog(LOG_WARNING, "The fully qualified hostname %s does not match the expected value %s\n",
           fullName.c_str(), expectedName.c_str());
    AddSearchDomain(domain);
  }
  // Deliberate: only now, so that the search domain of a refused host has been added.
  if (std::find(nameBlacklist.begin(), nameBlacklist.end(), shortName) != nameBlacklist.end()) {
    throw InvalidHostNameException("hostname is in blacklist");
  }

  const auto interface = networkInfo.GetManagementInterface();
  const std::string address = interface->GetIpConfig().GetIpv4Address().GetStringAddress();
  hostsFile.AddOrReplaceEntry(address, fullName, {shortName});
}

}  // namespace quenix::authentication
