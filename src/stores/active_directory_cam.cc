// The join through the CAM proxy, and what leads up to it.

#include <syslog.h>

#include <array>
#include <cerrno>
#include <fstream>
#include <utility>

#include "authentication/active_directory_config_store.h"
#include "authentication/active_directory_store.h"
#include "authentication/configuration.h"
#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"
#include "errors/system_text.h"
#include "errors/wiped_text.h"
#include "hostmgmt/ip_config.h"
#include "providers/active_directory_provider.h"
#include "providers/cam_proxy.h"
#include "stores/certificate_thumbprint.h"
#include "stores/host_name.h"
#include "stores/verify_certificate_option.h"

namespace quenix::authentication {

namespace {

void RequireIpv4Address(const std::string& camServer) {
  if (!HostMgmt::Network::Ipv4Address::IsValidAddress(camServer)) {
    throw InvalidIPAddressException("IPv4 address '" + camServer + "' cannot be parsed as an IP address");
  }
}

std::string ReadCAMProvider() {
  try {
    const CAMProviderConfiguration configuration;
    const auto provider = configuration.find("provider");
    return provider == configuration.end() ? "" : provider->second;
  } catch (const IOError&) {
    throw InvalidCAMProxyProviderException("(none installed)");
  }
}

std::string ConfiguredCAMProvider() {
  std::string provider = ReadCAMProvider();
  if (provider.empty()) throw InvalidCAMProxyProviderException("(unset)");
  return provider;
}

std::string StoredThumbprint() {
  try {
    return ActiveDirectoryConfigStore().GetThumbprint();
  } catch (const std::exception& failure) {
    syslog(LOG_ERR, "Unable to fetch thumbprint from Config Store: %s", failure.what());
    throw InvalidThumbprintStoreException("auth_proxy_certificate");
  }
}

/// A folder can be opened, but not be read.
std::string ReadWholeFile(const std::string& path) {
  std::ifstream file(path, std::ios_base::binary);
  if (!file.is_open()) throw FileNotFoundException();
  std::string text;
  std::array<char, 4096> buffer{};
  while (file.read(buffer.data(), buffer.size()) || file.gcount() > 0) {
    text.append(buffer.data(), static_cast<std::size_t>(file.gcount()));
  }
  if (file.bad()) {
    const std::string reason = SystemText(errno);
    throw IOError("Unable to read '" + path + "': " + reason);
  }
  return text;
}

CAM::DirectoryDomainInfo AskForDomain(const CAMProxy& proxy) {
  CAM::DirectoryDomainInfo domain;
  domain.netbiosDomainName = proxy.GetNetBIOSDomainName();
  domain.dnsDomainName = proxy.GetDNSDomainName();
  domain.domainSid = proxy.GetDomainSID();
  return domain;
}

}  // namespace

std::string ActiveDirectoryStore::GetDomainForCAMService(const std::string& camServer) {
  RequireIpv4Address(camServer);
  return CAMProxy(ConfiguredCAMProvider(), camServer, false, "").GetDNSDomainName();
}

void ActiveDirectoryStore::ImportCertificateForCAM(const std::string& certificate) {
  const std::string thumbprint = CertificateThumbprint(certificate);
  try {
    ActiveDirectoryConfigStore().StoreAuthProxyCertInfo(thumbprint, certificate);
  } catch (const OrvConfigStore::ConfigStoreException& failure) {
    syslog(LOG_ERR, "Failed to store thumbprint to Config Store: %s", failure.what());
    throw;
  }
}

void ActiveDirectoryStore::ImportCertificateForCAM(const std::string& path, const std::string&) {
  ImportCertificateForCAM(ReadWholeFile(path));
}

void ActiveDirectoryStore::JoinDomainWithCAM(const std::string& camServer, const std::string& container,
                                             bool skipHostnameCheck) {
  RequireIpv4Address(camServer);
  const bool verifyCertificate = MustVerifyCAMCertificate();
  const std::string hostName = LocalHostName();
  const std::string fullName = CanonicalHostName(hostName);
  const std::string provider = ConfiguredCAMProvider();
  const CAMProxy proxy(provider, camServer, verifyCertificate, verifyCertificate ? StoredThumbprint() : "");
  if (!skipHostnameCheck) SanitiseHostnameForDomain(proxy.GetDNSDomainName());

  ComputerPrincipalInfo principal = proxy.CreateMachineAccount(
      fullName, container.empty() ? proxy.GetDefaultComputerContainer() : container);
  const WipeAtEnd wipePrincipal(principal.joinBlob);
  const CAM::DirectoryDomainInfo domain = AskForDomain(proxy);
  CAM::MachineAccountInfo account;
  const WipeAtEnd wipeAccount(account.joinBlob);
  account.hostName = FirstLabel(hostName);
  account.dnsDomainName = domain.dnsDomainName;
  account.accountName = principal.accountName;
  account.joinBlob = principal.joinBlob;
  provider_->JoinDomainWithMachineAccount(domain, account);

  try {
    ActiveDirectoryConfigStore().StoreDomainInfo(domain.dnsDomainName, container, camServer);
  } catch (const std::exception& failure) {
    syslog(LOG_ERR, "Failed to store domain details to Config Store: %s.Leaving Domain...", failure.what());
    provider_->PartDomain();
    throw;
  }
}

}  // namespace quenix::authentication
