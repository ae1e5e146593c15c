// The table that the library binds: turns the plug-in's exceptions into statuses.
#include <syslog.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>

#include "authentication/plugin/cam_proxy_client.h"
#include "failure.h"
#include "service.h"

namespace {

using camproxy::Failure;
using camproxy::SecretString;
using camproxy::Service;

void ReleaseString(char* text) {
  explicit_bzero(text, std::strlen(text));
  std::free(text);
}

struct Release {
  void operator()(char* text) const { ReleaseString(text); }
};
using Result = std::unique_ptr<char, Release>;

Result CopyOf(const SecretString& text) {
  Result copy(static_cast<char*>(std::calloc(text.size() + 1, 1)));
  if (!copy) throw std::bad_alloc();
  std::copy(text.begin(), text.end(), copy.get());
  return copy;
}

/// A missing text is an empty one.
const char* OrEmpty(const char* text) {
  return text != nullptr ? text : "";
}

/// Runs `call` and returns its status. No exception passes the interface.
template <class Call>
std::uint32_t StatusOf(const char* server, Call call) noexcept {
  try {
    call();
    return camproxy::SUCCESS;
  } catch (const Failure& failure) {
    syslog(LOG_ERR, "CAM server %s: %s", OrEmpty(server), failure.what());
    return failure.GetStatus();
  } catch (const std::bad_alloc&) {
    return camproxy::OUT_OF_MEMORY;
  } catch (const std::exception& error) {
    syslog(LOG_ERR, "CAM server %s: %s", OrEmpty(server), error.what());
    return camproxy::UNEXPECTED_NETWORK_ERROR;
  }
}

std::uint32_t GetDomainInfo(const char* server, int verifyCertificate, const char* thumbprint,
                            char** netbiosDomainName, char** dnsDomainName, char** domainSid) {
  return StatusOf(server, [&] {
    const auto domain = Service(OrEmpty(server), verifyCertificate != 0, OrEmpty(thumbprint)).GetDomain();
    Result netbios = CopyOf(domain.netbiosDomainName);
    Result dns = CopyOf(domain.dnsDomainName);
    Result sid = CopyOf(domain.domainSid);
    *netbiosDomainName = netbios.release();
    *dnsDomainName = dns.release();
    *domainSid = sid.release();
  });
}

std::uint32_t CreateMachineAccount(const char* server, const char* hostName, const char* container,
                                   int verifyCertificate, const char* thumbprint, char** accountName,
                                   char** joinBlob) {
  return StatusOf(server, [&] {
    const auto account = Service(OrEmpty(server), verifyCertificate != 0, OrEmpty(thumbprint))
                             .CreateComputer(OrEmpty(hostName), container);
    Result name = CopyOf(account.accountName);
    Result blob = CopyOf(account.joinBlob);
    *accountName = name.release();
    *joinBlob = blob.release();
  });
}

}  // namespace

const struct CAMProxyClientOperations CAMProxyClientOperations = {nullptr, GetDomainInfo,
                                                                  CreateMachineAccount, ReleaseString};
