/// The plug-in's own settings file.
#ifndef CAM_SETTINGS_H
#define CAM_SETTINGS_H

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "fingerprint.h"
#include "secret.h"

namespace camproxy {

inline constexpr const char* SETTINGS_FILE = "/etc/quenix/velmor/cam.conf";

struct Settings {
  std::uint16_t port = 8443;
  /// For the TCP connection and the TLS handshake together.
  std::chrono::seconds connectTimeout{10};
  /// For a whole call, repetitions while the service is busy included.
  std::chrono::seconds requestTimeout{60};
  /// What the service wants for one creation; empty for none.
  SecretString token;
  /// The SHA-256 of the certificate that was imported, and of those of single servers by their address.
  std::optional<Sha256> sha256;
  std::map<std::string, Sha256> sha256OfServer;

  /// The one that counts for the server at that address.
  std::optional<Sha256> Sha256For(const std::string& server) const;
};

/// Reads the settings file; the defaults when there is none. Throws Failure for SETTINGS_FAULT when it cannot
/// be read, has a fault, may be written by others than its owner, belongs to another user than root and the
/// process's own, or holds a token that others can read.
Settings LoadSettings();

}  // namespace camproxy

#endif  // CAM_SETTINGS_H
