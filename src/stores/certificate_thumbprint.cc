#include "stores/certificate_thumbprint.h"

#include <openssl/bio.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <openssl/pem.h>
#include <openssl/x509.h>

#include <array>
#include <memory>
#include <string_view>

#include "authentication/library_exceptions.h"

namespace quenix::authentication {

namespace {

struct BioDeleter {
  void operator()(BIO* bio) const { BIO_free(bio); }
};
struct CertificateDeleter {
  void operator()(X509* certificate) const { X509_free(certificate); }
};
using Certificate = std::unique_ptr<X509, CertificateDeleter>;

/// Takes back the errors that OpenSSL has queued for this thread in the meantime: they are not the host's.
class ErrorQueueKeeper {
 public:
  ErrorQueueKeeper() { ERR_set_mark(); }
  ErrorQueueKeeper(const ErrorQueueKeeper&) = delete;
  ErrorQueueKeeper& operator=(const ErrorQueueKeeper&) = delete;
  ~ErrorQueueKeeper() { ERR_pop_to_mark(); }
};

Certificate ReadPem(const std::string& pem) {
  const std::unique_ptr<BIO, BioDeleter> bio(BIO_new(BIO_s_mem()));
  if (!bio || BIO_puts(bio.get(), pem.c_str()) < 0) return nullptr;
  // The empty pass phrase keeps OpenSSL from asking for one on the terminal when the text claims to be
  // encrypted.
  char noPassPhrase[] = "";
  return Certificate(PEM_read_bio_X509(bio.get(), nullptr, nullptr, noPassPhrase));
}

std::string ColonSeparatedHex(const unsigned char* bytes, unsigned int count) {
  constexpr std::string_view digits = "0123456789ABCDEF";
  std::string text;
  for (unsigned int i = 0; i < count; ++i) {
    if (i > 0) text += ':';
    text += digits[bytes[i] >> 4];
    text += digits[bytes[i] & 0xF];
  }
  return text;
}

}  // namespace

std::string CertificateThumbprint(const std::string& pem) {
  const ErrorQueueKeeper keepErrorQueue;
  const Certificate certificate = ReadPem(pem);
  if (!certificate) throw InvalidCertificateException();
  std::array<unsigned char, EVP_MAX_MD_SIZE> digest{};
  unsigned int length = 0;
  if (X509_digest(certificate.get(), EVP_sha1(), digest.data(), &length) <= 0) {
    throw InvalidCertificateException();
  }
  return ColonSeparatedHex(digest.data(), length);
}

}  // namespace quenix::authentication
