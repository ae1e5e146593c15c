// A piece of memory for a password or for a blob that holds one.
#ifndef CAMD_COMMON_SECRET_H
#define CAMD_COMMON_SECRET_H

#include <cstddef>
#include <string_view>

namespace camd {

// Owns bytes, followed by a zero byte, and wipes them before their memory is given back. It never grows, so
// that no unwiped copy stays behind. Movable, not copyable. Not for use by several threads at once.
class Secret {
 public:
  Secret() = default;
  explicit Secret(std::string_view text);
  // Room for `size` bytes, all zero, to be filled through Data().
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
  // Wipes and forgets the bytes after the first `size`.
  void Shorten(size_t size);

 private:
  void Wipe();

  char* data_ = nullptr;
  size_t size_ = 0;
};

}  // namespace camd

#endif  // CAMD_COMMON_SECRET_H
