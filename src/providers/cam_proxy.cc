#include "providers/cam_proxy.h"

#include <cstdint>

#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"

namespace quenix::authentication {

namespace {

const struct CAMProxyClientOperations* FindOperations(const PluginLibrary& library, const std::string& name) {
  const auto* operations =
      static_cast<const struct CAMProxyClientOperations*>(library.Find(CAM_PROXY_CLIENT_OPERATIONS_SYMBOL));
  if (operations == nullptr || operations->getDomainInfo == nullptr ||
      operations->createMachineAccount == nullptr || operations->releaseString == nullptr) {
    throw InvalidCAMProxyProviderException(name, PluginLibrary::LoaderText());
  }
  return operations;
}

void ThrowUnlessSuccess(std::uint32_t status) {
  switch (status) {
    case 0:
      return;
    case CAM_PROXY_STATUS_WRONG_CERTIFICATE:
      throw InvalidCAMCertificateException();
    case CAM_PROXY_STATUS_TIMED_OUT:
      throw WSATimedOutException();
    case CAM_PROXY_STATUS_NO_ROUTE:
      throw ConnectionInvalidException();
    case CAM_PROXY_STATUS_CONNECTION_REFUSED:
      throw ConnectionRefusedException();
    case CAM_PROXY_STATUS_OUT_OF_MEMORY:
      throw NotEnoughMemoryException();
    default:
      throw UnknownException(status);
  }
}

/// A string that a successful call returned; released at the end unless it is null.
class ReturnedText {
 public:
  ReturnedText(char* text, CAMProxyReleaseString release) : text_(text), release_(release) {}
  ReturnedText(const ReturnedText&) = delete;
  ReturnedText& operator=(const ReturnedText&) = delete;
  ~ReturnedText() {
    if (text_ != nullptr) release_(text_);
  }

  std::string Copy() const { return text_ == nullptr ? "" : text_; }

 private:
  char* text_;
  CAMProxyReleaseString release_;
};

}  // namespace

CAMProxy::CAMProxy(const std::string& provider, const std::string& server, bool verifyCertificate,
                   const std::string& thumbprint)
    : library_(provider, "Unable to open CAM provider: "),
      operations_(FindOperations(library_, provider)),
      verifyCertificate_(verifyCertificate),
      server_(server),
      thumbprint_(thumbprint) {}

CAMProxy::~CAMProxy() = default;

void CAMProxy::GetDomainInfo(std::string& netbiosName, std::string& dnsName, std::string& domainSid) const {
  char* texts[3] = {nullptr, nullptr, nullptr};
  ThrowUnlessSuccess(operations_->getDomainInfo(server_.c_str(), verifyCertificate_, thumbprint_.c_str(),
                                                &texts[0], &texts[1], &texts[2]));
  const ReturnedText netbios(texts[0], operations_->releaseString);
  const ReturnedText dns(texts[1], operations_->releaseString);
  const ReturnedText sid(texts[2], operations_->releaseString);
  netbios.Copy().swap(netbiosName);
  dns.Copy().swap(dnsName);
  sid.Copy().swap(domainSid);
}

std::string CAMProxy::GetNetBIOSDomainName() const {
  std::string netbiosName, dnsName, domainSid;
  GetDomainInfo(netbiosName, dnsName, domainSid);
  return netbiosName;
}

std::string CAMProxy::GetDNSDomainName() const {
  std::string netbiosName, dnsName, domainSid;
  GetDomainInfo(netbiosName, dnsName, domainSid);
  return dnsName;
}

std::string CAMProxy::GetDomainSID() const {
  std::string netbiosName, dnsName, domainSid;
  GetDomainInfo(netbiosName, dnsName, domainSid);
  return domainSid;
}

std::string CAMProxy::GetDefaultComputerContainer() const {
  return "";
}

std::string CAMProxy::GetDomainController() const {
  return "";
}

ComputerPrincipalInfo CAMProxy::CreateMachineAccount(const std::string& hostName,
                                                     const std::string& container) const {
  char* texts[2] = {nullptr, nullptr};
  ThrowUnlessSuccess(operations_->createMachineAccount(
      server_.c_str(), hostName.c_str(), container.empty() ? nullptr : container.c_str(), verifyCertificate_,
      thumbprint_.c_str(), &texts[0], &texts[1]));
  const ReturnedText accountName(texts[0], operations_->releaseString);
  const ReturnedText joinBlob(texts[1], operations_->releaseString);
  ComputerPrincipalInfo principal;
  principal.accountName = accountName.Copy();
  principal.joinBlob = joinBlob.Copy();
  return principal;
}

}  // namespace quenix::authentication
