/// Memory for a password.
#ifndef VELMORCTL_SECRET_H
#define VELMORCTL_SECRET_H

#include <cstddef>

namespace velmorctl {

/// A zero-terminated text that stays in one place, is left out of swap and core dumps where the system
/// allows it, and is wiped when this object ends. For one thread at a time.
class Secret {
 public:
  /// The greatest number of characters.
  static constexpr std::size_t maximumLength = 4000;

  /// Throws std::bad_alloc when there is no memory.
  Secret();
  Secret(const Secret&) = delete;
  Secret& operator=(const Secret&) = delete;
  ~Secret();

  /// Appends a character; false when the text is full.
  bool Append(char character);
  void RemoveLast();
  void Clear();

  const char* Text() const noexcept { return memory_; }
  std::size_t Length() const noexcept { return length_; }

 private:
  char* memory_;
  std::size_t length_ = 0;
};

/// Keeps the memory of this process out of core files: a provider, too, holds the secret that it is given.
void ForbidCoreFiles();

}  // namespace velmorctl

#endif  // VELMORCTL_SECRET_H
