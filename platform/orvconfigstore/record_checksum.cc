#include "orvconfigstore/record_checksum.h"

namespace OrvConfigStore {
namespace {

/// FNV-1a with 64 bits.
class Hash {
 public:
  /// Takes the length in as well, so that texts side by side cannot be told otherwise apart.
  void Add(const std::string& text) {
    for (std::uint64_t size = text.size(), shift = 0; shift < 64; shift += 8) AddByte((size >> shift) & 0xff);
    for (const char character : text) AddByte(static_cast<unsigned char>(character));
  }

  std::int64_t Get() const { return static_cast<std::int64_t>(hash_); }

 private:
  void AddByte(std::uint64_t byte) { hash_ = (hash_ ^ byte) * 0x100000001b3U; }

  std::uint64_t hash_ = 0xcbf29ce484222325U;
};

}  // namespace

std::int64_t ChecksumOf(const std::string& namespaceName, const StoreObject& object) {
  Hash hash;
  hash.Add(namespaceName);
  hash.Add(object.GetId().GetComponent());
  hash.Add(object.GetId().GetGroup());
  hash.Add(object.GetId().GetKey());
  for (const auto& [field, value] : object.GetValues()) {
    hash.Add(field);
    hash.Add(value);
  }
  return hash.Get();
}

}  // namespace OrvConfigStore
