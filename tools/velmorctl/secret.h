/// Memory for a password.
#ifndef VELMORCTL_SECRET_H
#define VELMORCTL_SECRET_H

#include <cstddef>

#include "velmor/secret.h"

namespace velmorctl {

/// A zero-terminated text that is written character by character into the memory of a velmor::Secret. For one
/// thread at a time.
class Secret {
 public:
  /// The greatest number of characters.
  static constexpr std::size_t maximumLength = 4000;

  Secret() = default;
  Secret(const Secret&) = delete;
  Secret& operator=(const Secret&) = delete;

  /// Appends a character; false when the text is full.
  bool Append(char character);
  void RemoveLast();
  void Clear();

  const char* Text() const noexcept { return memory_.Text(); }
  std::size_t Length() const noexcept { return length_; }

 private:
  velmor::Secret memory_{maximumLength};
  std::size_t length_ = 0;
};

/// Keeps the memory of this process out of core files: a provider, too, holds the secret that it is given.
void ForbidCoreFiles();

}  // namespace velmorctl

#endif  // VELMORCTL_SECRET_H
