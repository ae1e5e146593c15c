/// A piece of memory for a secret.
#ifndef SAMBA_COMMON_SECRET_H
#define SAMBA_COMMON_SECRET_H

#include <cstddef>
#include <string_view>

namespace sambaprovider {

/// Owns a copy of a secret, followed by a zero byte, and wipes it before the memory is given back. It never
/// grows, so that no unwiped copy is left behind. Movable, not copyable.
class Secret {
 public:
  Secret() = default;
  explicit Secret(std::string_view text);
  /// Room for `size` bytes, all zero, to be filled through Data().
  explicit Secret(size_t size);
  Secret(Secret&& other) noexcept;
  Secret& operator=(Secret&& other) noexcept;
  Secret(const Secret&) = delete;
  Secret& operator=(const Secret&) = delete;
  ~Secret();

  char* Data() { return data_; }
  const char* Text() const { return data_ == nullptr ? "" : data_; }
  size_t Size() const { return size_; }
  std::string_view View() const { return {Text(), size_}; }

 private:
  void Wipe();

  char* data_ = nullptr;
  size_t size_ = 0;
};

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_SECRET_H
