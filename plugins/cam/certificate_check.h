/// Whether the service is the one that the host trusts.
#ifndef CAM_CERTIFICATE_CHECK_H
#define CAM_CERTIFICATE_CHECK_H

#include <openssl/ssl.h>

#include <optional>
#include <string>

#include "fingerprint.h"

namespace camproxy {

/// Compares the server's certificate with what the host knows of it, inside the TLS handshake: a server with
/// another certificate gets an alert and nothing else.
///
/// The digests alone decide. Neither the certificate's issuer nor its names count, and a certificate that is
/// past its date is accepted with a warning in the system log: the host was told to trust this very one.
class CertificateCheck {
 public:
  /// The certificate must have the SHA-1 `thumbprint` and, where one is given, the SHA-256.
  CertificateCheck(std::string server, std::string thumbprint, std::optional<Sha256> sha256);

  /// Makes the context's handshakes call this check, which must outlive them.
  void Install(SSL_CTX* context);

  /// Throws Failure when a certificate was refused: for WRONG_CERTIFICATE, or for OUT_OF_MEMORY when it could
  /// not be looked at.
  void ThrowIfRefused() const;

  /// Throws Failure for WRONG_CERTIFICATE unless a certificate was accepted. For a handshake that succeeded:
  /// one without certificates, should the machine's settings of OpenSSL allow that, calls nobody to compare.
  void ThrowUnlessAccepted() const;

 private:
  static int Verify(X509_STORE_CTX* handshake, void* self);

  bool Accepts(const X509& certificate);
  void WarnOfDate(const X509& certificate) const;

  std::string server_;
  std::string thumbprint_;
  std::optional<Sha256> sha256_;
  std::string difference_;
  bool outOfMemory_ = false;
  bool accepted_ = false;
};

}  // namespace camproxy

#endif  // CAM_CERTIFICATE_CHECK_H
