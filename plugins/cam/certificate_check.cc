#include "certificate_check.h"

#include <openssl/x509_vfy.h>
#include <syslog.h>

#include <new>
#include <utility>

#include "failure.h"

namespace camproxy {

namespace {

std::string Difference(const char* digest, const std::string& seen, const std::string& expected) {
  return std::string("its certificate has the ") + digest + " " + seen + ", not " +
         (expected.empty() ? "one that was imported" : expected);
}

}  // namespace

CertificateCheck::CertificateCheck(std::string server, std::string thumbprint, std::optional<Sha256> sha256)
    : server_(std::move(server)), thumbprint_(std::move(thumbprint)), sha256_(sha256) {}

void CertificateCheck::Install(SSL_CTX* context) {
  accepted_ = false;  // each connection has to show its own
  SSL_CTX_set_verify(context, SSL_VERIFY_PEER, nullptr);
  SSL_CTX_set_cert_verify_callback(context, Verify, this);
}

void CertificateCheck::ThrowIfRefused() const {
  if (outOfMemory_) throw Failure(OUT_OF_MEMORY, "its certificate cannot be looked at: out of memory");
  if (!difference_.empty()) throw Failure(WRONG_CERTIFICATE, difference_);
}

void CertificateCheck::ThrowUnlessAccepted() const {
  if (!accepted_) throw Failure(WRONG_CERTIFICATE, "it showed no certificate");
}

int CertificateCheck::Verify(X509_STORE_CTX* handshake, void* self) {
  auto& check = *static_cast<CertificateCheck*>(self);
  try {
    const X509* certificate = X509_STORE_CTX_get0_cert(handshake);
    if (certificate != nullptr && check.Accepts(*certificate)) {
      check.accepted_ = true;
      check.WarnOfDate(*certificate);
      X509_STORE_CTX_set_error(handshake, X509_V_OK);
      return 1;
    }
  } catch (const std::bad_alloc&) {
    check.outOfMemory_ = true;
  }
  X509_STORE_CTX_set_error(handshake, X509_V_ERR_CERT_UNTRUSTED);
  return 0;
}

bool CertificateCheck::Accepts(const X509& certificate) {
  const std::string sha1 = FingerprintOf(certificate, *EVP_sha1());
  if (sha1 != thumbprint_) {
    difference_ = Difference("SHA-1", sha1, thumbprint_);
    return false;
  }
  if (!sha256_) return true;
  const std::string sha256 = FingerprintOf(certificate, *EVP_sha256());
  if (sha256 != Write(*sha256_)) {
    difference_ = Difference("SHA-256", sha256, Write(*sha256_));
    return false;
  }
  return true;
}

void CertificateCheck::WarnOfDate(const X509& certificate) const {
  if (X509_cmp_current_time(X509_get0_notAfter(&certificate)) < 0) {
    syslog(LOG_WARNING,
           "CAM server %s: its certificate is past its date; accepted, since it is the imported one",
           server_.c_str());
  } else if (X509_cmp_current_time(X509_get0_notBefore(&certificate)) > 0) {
    syslog(LOG_WARNING,
           "CAM server %s: its certificate is not valid yet; accepted, since it is the imported one",
           server_.c_str());
  }
}

}  // namespace camproxy
