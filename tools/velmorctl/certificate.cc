#include "certificate.h"

#include <openssl/bio.h>
#include <openssl/err.h>
#include <openssl/evp.h>
#include <openssl/pem.h>

#include <algorithm>
#include <cctype>
#include <iterator>
#include <new>

#include "failure.h"

namespace velmorctl {

namespace {

std::string Digest(const X509& certificate, const EVP_MD* algorithm) {
  constexpr char digits[] = "0123456789ABCDEF";
  unsigned char digest[EVP_MAX_MD_SIZE];
  unsigned int size = 0;
  if (X509_digest(&certificate, algorithm, digest, &size) != 1) {
    throw std::bad_alloc();
  }
  std::string text;
  for (unsigned int index = 0; index < size; ++index) {
    text += index == 0 ? "" : ":";
    text += digits[digest[index] >> 4U];
    text += digits[digest[index] & 0x0FU];
  }
  return text;
}

/// What `print` writes into a BIO.
template <class Print>
std::string Printed(Print print) {
  std::unique_ptr<BIO, int (*)(BIO*)> memory(BIO_new(BIO_s_mem()), BIO_free);
  if (memory == nullptr || !print(memory.get())) {
    throw std::bad_alloc();
  }
  char* data = nullptr;
  long size = BIO_get_mem_data(memory.get(), &data);
  return {data, static_cast<std::size_t>(size)};
}

std::string Time(const ASN1_TIME* time) {
  return Printed([time](BIO* bio) { return ASN1_TIME_print(bio, time) == 1; });
}

}  // namespace

Certificate Certificate::FromPem(const std::string& text, const std::string& source) {
  std::unique_ptr<BIO, int (*)(BIO*)> memory(BIO_new_mem_buf(text.data(), static_cast<int>(text.size())),
                                             BIO_free);
  // The empty pass phrase keeps OpenSSL from asking for one at the terminal when the text claims to be
  // encrypted.
  char noPassPhrase[] = "";
  X509* certificate = memory ? PEM_read_bio_X509(memory.get(), nullptr, nullptr, noPassPhrase) : nullptr;
  ERR_clear_error();
  if (certificate == nullptr) {
    throw Failure(ExitCode::Proxy, "'" + source + "' holds no certificate in PEM form")
        .Try("openssl x509 -inform DER -in FILE -out FILE.pem");
  }
  return Certificate(certificate);
}

std::string Certificate::Sha1() const {
  return Digest(*certificate_, EVP_sha1());
}

std::string Certificate::Sha256() const {
  return Digest(*certificate_, EVP_sha256());
}

std::string Certificate::Subject() const {
  return Printed([this](BIO* bio) {
    return X509_NAME_print_ex(bio, X509_get_subject_name(certificate_.get()), 0, XN_FLAG_ONELINE) >= 0;
  });
}

std::string Certificate::ValidFrom() const {
  return Time(X509_get0_notBefore(certificate_.get()));
}

std::string Certificate::ValidUntil() const {
  return Time(X509_get0_notAfter(certificate_.get()));
}

bool Certificate::IsPastItsDate() const {
  return X509_cmp_current_time(X509_get0_notAfter(certificate_.get())) < 0;
}

std::string Certificate::Pem() const {
  return Printed([this](BIO* bio) { return PEM_write_bio_X509(bio, certificate_.get()) == 1; });
}

bool IsSameFingerprint(const std::string& left, const std::string& right) {
  auto plain = [](const std::string& text) {
    std::string digits;
    std::copy_if(text.begin(), text.end(), std::back_inserter(digits), [](char c) { return c != ':'; });
    std::transform(digits.begin(), digits.end(), digits.begin(),
                   [](unsigned char c) { return static_cast<char>(std::toupper(c)); });
    return digits;
  };
  return plain(left) == plain(right);
}

}  // namespace velmorctl
