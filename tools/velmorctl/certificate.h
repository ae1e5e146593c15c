/// The certificate of a CAM service, as the command shows and compares it.
#ifndef VELMORCTL_CERTIFICATE_H
#define VELMORCTL_CERTIFICATE_H

#include <openssl/x509.h>

#include <cstdint>
#include <memory>
#include <string>

namespace velmorctl {

/// A certificate. Copies share it.
class Certificate {
 public:
  /// The first certificate of a PEM text. Throws Failure when there is none; `source` names it then.
  static Certificate FromPem(const std::string& text, const std::string& source);

  /// The certificate that the TLS server at an IPv4 address shows. Nothing is sent but the TLS handshake, and
  /// nothing is verified. Waits at most ten seconds for each answer. Throws Failure.
  static Certificate OfServer(const std::string& address, std::uint16_t port);

  /// The digest of the DER encoding: upper-case pairs of hexadecimal digits, separated by ":".
  std::string Sha1() const;
  std::string Sha256() const;

  std::string Subject() const;
  /// Points in time as OpenSSL writes them, in UTC.
  std::string ValidFrom() const;
  std::string ValidUntil() const;
  bool IsPastItsDate() const;

  std::string Pem() const;

 private:
  explicit Certificate(X509* certificate) : certificate_(certificate, X509_free) {}

  std::shared_ptr<X509> certificate_;
};

/// Whether both are the same digest, whatever the case of the digits and with or without ":".
bool IsSameFingerprint(const std::string& left, const std::string& right);

}  // namespace velmorctl

#endif  // VELMORCTL_CERTIFICATE_H
