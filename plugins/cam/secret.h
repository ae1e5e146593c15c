/// Text whose memory is wiped before it is given back.
#ifndef CAM_SECRET_H
#define CAM_SECRET_H

#include <cstring>
#include <memory>
#include <string>

namespace camproxy {

/// Allocates as std::allocator does and wipes what it is given back, so that a container that grows leaves no
/// copy of its content behind.
template <class T>
class WipingAllocator {
 public:
  using value_type = T;

  WipingAllocator() = default;
  template <class Other>
  WipingAllocator(const WipingAllocator<Other>&) noexcept {}  // NOLINT(google-explicit-constructor): rebinds

  T* allocate(std::size_t count) { return std::allocator<T>().allocate(count); }
  void deallocate(T* memory, std::size_t count) noexcept {
    explicit_bzero(static_cast<void*>(memory), count * sizeof(T));
    std::allocator<T>().deallocate(memory, count);
  }

  template <class Other>
  bool operator==(const WipingAllocator<Other>&) const noexcept {
    return true;
  }
};

/// For what holds a secret, or may hold one. Texts of up to fifteen characters are kept without an allocation
/// and are not wiped: what is secret here is longer.
using SecretString = std::basic_string<char, std::char_traits<char>, WipingAllocator<char>>;

}  // namespace camproxy

#endif  // CAM_SECRET_H
