/// What a certificate is recognised by.
#ifndef STORES_CERTIFICATE_THUMBPRINT_H
#define STORES_CERTIFICATE_THUMBPRINT_H

#include <string>

namespace quenix::authentication {

/// The SHA-1 digest of the first certificate in a PEM text: 20 pairs of upper-case hexadecimal digits with
/// colons between them. Throws InvalidCertificateException when the text holds no certificate in PEM form.
/// Leaves the thread's queue of OpenSSL errors as it was.
std::string CertificateThumbprint(const std::string& pem);

}  // namespace quenix::authentication

#endif  // STORES_CERTIFICATE_THUMBPRINT_H
