#include "cam/certificate.h"

#include <cstdio>
#include <stdexcept>

namespace camtest {

namespace {

constexpr std::size_t RSA_BITS = 2048;

EVP_PKEY* MakeKey(KeyKind kind) {
  return kind == KeyKind::EC ? EVP_PKEY_Q_keygen(nullptr, nullptr, "EC", "P-256")
                             : EVP_PKEY_Q_keygen(nullptr, nullptr, "RSA", RSA_BITS);
}

std::string Digest(X509* certificate, const EVP_MD* algorithm) {
  unsigned char digest[EVP_MAX_MD_SIZE];
  unsigned int size = 0;
  if (X509_digest(certificate, algorithm, digest, &size) != 1) throw std::runtime_error("X509_digest");
  std::string text;
  for (unsigned int index = 0; index < size; ++index) {
    char pair[4];
    std::snprintf(pair, sizeof pair, index == 0 ? "%02X" : ":%02X", digest[index]);
    text += pair;
  }
  return text;
}

}  // namespace

Identity::Identity(KeyKind kind, std::chrono::hours start, std::chrono::hours end)
    : key_(MakeKey(kind), EVP_PKEY_free), certificate_(X509_new(), X509_free) {
  X509* certificate = certificate_.get();
  X509_set_version(certificate, X509_VERSION_3);
  ASN1_INTEGER_set(X509_get_serialNumber(certificate), 1);
  X509_gmtime_adj(X509_getm_notBefore(certificate), std::chrono::seconds(start).count());
  X509_gmtime_adj(X509_getm_notAfter(certificate), std::chrono::seconds(end).count());
  X509_NAME* name = X509_get_subject_name(certificate);
  X509_NAME_add_entry_by_txt(name, "CN", MBSTRING_ASC, reinterpret_cast<const unsigned char*>("cam.example"),
                             -1, -1, 0);
  X509_set_issuer_name(certificate, name);
  X509_set_pubkey(certificate, key_.get());
  if (X509_sign(certificate, key_.get(), EVP_sha256()) == 0) throw std::runtime_error("X509_sign");
}

std::string Identity::Sha1() const {
  return Digest(certificate_.get(), EVP_sha1());
}

std::string Identity::Sha256() const {
  return Digest(certificate_.get(), EVP_sha256());
}

}  // namespace camtest
