/// Importing the certificate of a CAM service.
#ifndef VELMORCTL_CAM_TRUST_H
#define VELMORCTL_CAM_TRUST_H

#include <string>
#include <vector>

#include "certificate.h"
#include "exit_codes.h"
#include "output.h"
#include "situation.h"

namespace velmorctl {

struct TrustOptions {
  std::string source;  /// a server's IPv4 address, or the path of a PEM file
  std::string sha256;  /// what the certificate must have, if not empty
  bool yes = false;
};

ExitCode TrustCertificate(const TrustOptions& options, Situation& situation);

/// Whether the text is an IPv4 address.
bool IsAddress(const std::string& text);

/// The certificate in rows for a table, and as JSON.
std::vector<std::vector<std::string>> Rows(const Certificate& certificate);
Json AsJson(const Certificate& certificate);

}  // namespace velmorctl

#endif  // VELMORCTL_CAM_TRUST_H
