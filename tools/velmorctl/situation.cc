#include "situation.h"

#include <openssl/evp.h>

#include <cstring>
#include <filesystem>
#include <fstream>
#include <new>

namespace velmorctl {

namespace {

constexpr std::uintmax_t greatestWatchedSize = 1 << 20;

/// A digest in place of the content, which may be a secret; read past the stream's own buffer for that
/// reason.
std::optional<std::string> DigestOf(const std::string& file) {
  std::error_code error;
  if (!std::filesystem::is_regular_file(file, error)) {
    return std::nullopt;
  }
  const auto size = std::filesystem::file_size(file, error);
  if (error || size > greatestWatchedSize) {
    return std::nullopt;
  }
  std::ifstream stream;
  stream.rdbuf()->pubsetbuf(nullptr, 0);
  stream.open(file, std::ios::binary);
  if (!stream) {
    return std::nullopt;
  }
  std::string content(size, '\0');
  stream.read(content.data(), static_cast<std::streamsize>(size));
  std::string digest(EVP_MAX_MD_SIZE, '\0');
  const bool done =
      EVP_Digest(content.data(), content.size(), reinterpret_cast<unsigned char*>(digest.data()), nullptr,
                 EVP_sha256(), nullptr) == 1;
  explicit_bzero(content.data(), content.size());
  if (!done) {
    throw std::bad_alloc();
  }
  return digest;
}

}  // namespace

void Situation::Watch(const std::string& file) {
  files_.push_back({file, DigestOf(file)});
}

void Situation::AddChange(const std::string& change) {
  changes_.push_back(change);
}

void Situation::ForgetChanges() {
  changes_.clear();
}

std::vector<std::string> Situation::Changes() const {
  std::vector<std::string> changes = changes_;
  for (const WatchedFile& watched : files_) {
    if (DigestOf(watched.file) != watched.digest) {
      changes.push_back(watched.file);
    }
  }
  return changes;
}

}  // namespace velmorctl
