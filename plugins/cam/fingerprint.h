/// Digests of certificates, and how people write them.
#ifndef CAM_FINGERPRINT_H
#define CAM_FINGERPRINT_H

#include <openssl/evp.h>
#include <openssl/x509.h>

#include <array>
#include <optional>
#include <string>
#include <string_view>

namespace camproxy {

/// The SHA-256 of a certificate's DER encoding.
using Sha256 = std::array<unsigned char, 32>;

/// Reads 64 hexadecimal digits of either case, with or without ":" between the pairs; nothing for any other
/// text.
std::optional<Sha256> ParseSha256(std::string_view text);

/// The digest of the certificate as upper-case pairs of hexadecimal digits separated by ":". Throws
/// std::bad_alloc when OpenSSL cannot compute it.
std::string FingerprintOf(const X509& certificate, const EVP_MD& algorithm);

/// The digest in the same form.
std::string Write(const Sha256& digest);

}  // namespace camproxy

#endif  // CAM_FINGERPRINT_H
