/// A piece of memory for a secret.
#ifndef VELMOR_SECRET_H
#define VELMOR_SECRET_H

#include <cstddef>
#include <string_view>

namespace velmor {

/// Owns bytes, followed by a zero byte, in memory of their own: it is left out of core files, of swap where
/// the system allows it, and is wiped before it is given back. It never grows, so that no unwiped copy stays
/// behind. An empty one takes no memory. Movable, not copyable. For one thread at a time.
class Secret {
 public:
  Secret() = default;
  /// Throws std::bad_alloc when there is no memory.
  explicit Secret(std::string_view text);
  /// Room for `size` bytes, all zero, to be filled through Data(). Throws std::bad_alloc.
  explicit Secret(std::size_t size);
  Secret(Secret&& other) noexcept;
  Secret& operator=(Secret&& other) noexcept;
  Secret(const Secret&) = delete;
  Secret& operator=(const Secret&) = delete;
  ~Secret();

  /// Null when it is empty from the start.
  char* Data() { return data_; }
  const char* Text() const { return data_ == nullptr ? "" : data_; }
  std::size_t Size() const { return size_; }
  std::string_view View() const { return {Text(), size_}; }

  /// Wipes and forgets the bytes after the first `size`.
  void Shorten(std::size_t size);

 private:
  void Release();

  char* data_ = nullptr;
  std::size_t size_ = 0;
  std::size_t mappedSize_ = 0;
};

}  // namespace velmor

#endif  // VELMOR_SECRET_H
