/// The CAM service, as its protocol (docs/cam-protocol.md) describes it.
#ifndef CAM_SERVICE_H
#define CAM_SERVICE_H

#include <optional>
#include <string>

#include "https_exchange.h"
#include "secret.h"
#include "settings.h"

namespace camproxy {

struct DomainInfo {
  SecretString netbiosDomainName;
  SecretString dnsDomainName;
  SecretString domainSid;
};

struct MachineAccount {
  SecretString accountName;
  SecretString joinBlob;
};

/// Asks one service, for one call of the plug-in. Each operation lasts at most the settings' request
/// time-out and throws Failure: as Exchange does; for the status that the service gives; for INVALID_DATA
/// when the answer is not what the protocol says; for TIMED_OUT when the service stays busy.
class Service {
 public:
  /// The service at an IPv4 address. With `verifyCertificate` its certificate must have the SHA-1
  /// `thumbprint`, and the SHA-256 that the settings hold for it. Throws Failure for INVALID_PARAMETER when
  /// `server` is no IPv4 address.
  Service(const std::string& server, bool verifyCertificate, const std::string& thumbprint);

  DomainInfo GetDomain();

  /// `container` may be null, for the directory's default place. Throws Failure for INVALID_PARAMETER when
  /// one of the texts is not UTF-8.
  MachineAccount CreateComputer(const char* hostName, const char* container);

 private:
  /// Sends the request, once more each time when the service is busy and says when to come again.
  Answer Ask(const Request& request, unsigned int successStatus);

  std::string server_;
  Settings settings_;
  std::optional<CertificateCheck> check_;
};

}  // namespace camproxy

#endif  // CAM_SERVICE_H
