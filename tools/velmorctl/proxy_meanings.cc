#include "proxy_meanings.h"

#include <algorithm>
#include <iterator>

#include "authentication/exception.h"
#include "authentication/library_exceptions.h"
#include "authentication/provider_exceptions.h"

namespace velmorctl {

namespace {

namespace authentication = quenix::authentication;

constexpr char checkWay[] =
    "check the service's address and the port in /etc/quenix/velmor/cam.conf, and whether the service runs";
constexpr char askOperator[] = "ask the service's administrator; its log says why";
constexpr char checkName[] =
    "give the host a name of at most 15 letters, digits and hyphens (hostnamectl set-hostname, /etc/hosts)";

struct CodeRow {
  unsigned long code;
  Meaning meaning;
};

/// By status code, ascending: those of the plug-in and of the service.
constexpr CodeRow codeRows[] = {
    {5,
     {ExitCode::Proxy,
      "have the service's administrator allow this host's name and address, or give another --container"}},
    {8, {ExitCode::Proxy, "free some memory"}},
    {13, {ExitCode::Proxy, "there may be another service at that address and port"}},
    {50, {ExitCode::Proxy, "there may be another service at that address and port"}},
    {59, {ExitCode::Proxy, "look into the system log"}},
    {87, {ExitCode::Proxy, askOperator}},
    {170, {ExitCode::Proxy, "the service is busy: try again later"}},
    {267, {ExitCode::Proxy, "give a --container that exists and that the service may write"}},
    {1061, {ExitCode::Proxy, "an account of this name is being created or removed: try again in a minute"}},
    {1064, {ExitCode::Proxy, "the system log names the fault in /etc/quenix/velmor/cam.conf"}},
    {1210, {ExitCode::Proxy, checkName}},
    {1225, {ExitCode::Proxy, checkWay}},
    {1229, {ExitCode::Proxy, checkWay}},
    {1311, {ExitCode::Proxy, "no domain controller answers the service: ask its administrator"}},
    {1326, {ExitCode::Proxy, "put a token that was not used yet into /etc/quenix/velmor/cam.conf"}},
    {1816, {ExitCode::Proxy, "the service was asked too often: try again later"}},
    {2224,
     {ExitCode::Proxy,
      "a computer account of this name exists: rename this host, or have the account removed"}},
    {10054,
     {ExitCode::Proxy,
      "the service hung up; the computer account may have been created, so have it removed first"}},
    {10060, {ExitCode::Proxy, checkWay}},
    {0x80090326, {ExitCode::Proxy, "the service must speak TLS 1.2 or newer at that port"}},
};
static_assert(std::is_sorted(std::begin(codeRows), std::end(codeRows),
                             [](const CodeRow& left, const CodeRow& right) {
                               return left.code < right.code;
                             }));

/// Of any other status that the plug-in or the service gives.
constexpr Meaning otherStatus = {ExitCode::Proxy, askOperator};
constexpr Meaning noPlugin = {ExitCode::Proxy,
                              "make /etc/quenix/velmor/camprovider.conf with the line: provider = \"cam\""};
constexpr Meaning noPluginFile = {ExitCode::Proxy, "install the plug-in that camprovider.conf names"};
constexpr Meaning otherCertificate = {
    ExitCode::Proxy,
    "compare the service's fingerprints with \"velmorctl cam show\"; then \"velmorctl cam trust ADDRESS\""};
constexpr Meaning noCertificate = {ExitCode::Proxy, "velmorctl cam trust ADDRESS"};

template <class Class>
bool Is(const std::exception& exception) {
  return dynamic_cast<const Class*>(&exception) != nullptr;
}

}  // namespace

const Meaning& ProxyMeaningOf(const std::exception& exception) {
  const auto* coded = dynamic_cast<const authentication::Exception*>(&exception);
  if (coded != nullptr && coded->Code() != 0) {
    const auto* row =
        std::find_if(std::begin(codeRows), std::end(codeRows),
                     [coded](const CodeRow& candidate) { return candidate.code == coded->Code(); });
    if (row != std::end(codeRows)) {
      return row->meaning;
    }
  }
  if (Is<authentication::UnknownException>(exception)) {
    return otherStatus;
  }
  if (Is<authentication::InvalidCAMProxyProviderException>(exception)) {
    return noPlugin;
  }
  if (Is<authentication::InvalidCAMCertificateException>(exception)) {
    return otherCertificate;
  }
  if (Is<authentication::InvalidThumbprintStoreException>(exception)) {
    return noCertificate;
  }
  return Is<authentication::IOError>(exception) ? noPluginFile : MeaningOf(exception);
}

}  // namespace velmorctl
