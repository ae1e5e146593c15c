#include "fingerprint.h"

#include <charconv>
#include <new>

namespace camproxy {

namespace {

std::string WritePairs(const unsigned char* bytes, std::size_t count) {
  constexpr std::string_view digits = "0123456789ABCDEF";
  std::string text;
  for (std::size_t index = 0; index < count; ++index) {
    if (index > 0) text += ':';
    text += digits[bytes[index] >> 4U];
    text += digits[bytes[index] & 0x0FU];
  }
  return text;
}

}  // namespace

std::optional<Sha256> ParseSha256(std::string_view text) {
  Sha256 digest{};
  for (std::size_t index = 0; index < digest.size(); ++index) {
    if (index > 0 && text.starts_with(':')) text.remove_prefix(1);
    if (text.size() < 2) return std::nullopt;
    const auto [end, error] = std::from_chars(text.data(), text.data() + 2, digest[index], 16);
    if (error != std::errc() || end != text.data() + 2) return std::nullopt;
    text.remove_prefix(2);
  }
  return text.empty() ? std::optional(digest) : std::nullopt;
}

std::string FingerprintOf(const X509& certificate, const EVP_MD& algorithm) {
  std::array<unsigned char, EVP_MAX_MD_SIZE> digest{};
  unsigned int size = 0;
  if (X509_digest(&certificate, &algorithm, digest.data(), &size) <= 0) throw std::bad_alloc();
  return WritePairs(digest.data(), size);
}

std::string Write(const Sha256& digest) {
  return WritePairs(digest.data(), digest.size());
}

}  // namespace camproxy
