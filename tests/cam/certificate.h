/// Certificates made for a test.
#ifndef TESTS_CAM_CERTIFICATE_H
#define TESTS_CAM_CERTIFICATE_H

#include <openssl/evp.h>
#include <openssl/x509.h>

#include <chrono>
#include <memory>
#include <string>

namespace camtest {

enum class KeyKind { EC, RSA };

/// A self-signed certificate with its key. Copies share both.
class Identity {
 public:
  /// Valid from `start` to `end`, both counted from now.
  explicit Identity(KeyKind kind = KeyKind::EC, std::chrono::hours start = std::chrono::hours(-1),
                    std::chrono::hours end = std::chrono::hours(1));

  X509* Certificate() const { return certificate_.get(); }
  EVP_PKEY* Key() const { return key_.get(); }

  /// Upper-case pairs separated by ":".
  std::string Sha1() const;
  std::string Sha256() const;

 private:
  std::shared_ptr<EVP_PKEY> key_;
  std::shared_ptr<X509> certificate_;
};

/// One that is past its date.
inline Identity ExpiredIdentity() {
  return Identity(KeyKind::EC, std::chrono::hours(-48), std::chrono::hours(-24));
}

}  // namespace camtest

#endif  // TESTS_CAM_CERTIFICATE_H
