#include "common/secret.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace camd {

Secret::Secret(std::string_view text) : Secret(text.size()) {
  std::copy(text.begin(), text.end(), data_);
}

Secret::Secret(size_t size) : data_(new char[size + 1]()), size_(size) {}

Secret::Secret(Secret&& other) noexcept
    : data_(std::exchange(other.data_, nullptr)), size_(std::exchange(other.size_, 0)) {}

Secret& Secret::operator=(Secret&& other) noexcept {
  if (this != &other) {
    Wipe();
    data_ = std::exchange(other.data_, nullptr);
    size_ = std::exchange(other.size_, 0);
  }
  return *this;
}

Secret::~Secret() {
  Wipe();
}

// The rest keeps its place in memory and is wiped here; what is left is wiped at the end.
void Secret::Shorten(size_t size) {
  if (size >= size_) return;
  explicit_bzero(data_ + size, size_ - size);
  size_ = size;
}

void Secret::Wipe() {
  if (data_ == nullptr) return;
  explicit_bzero(data_, size_ + 1);
  delete[] data_;
  data_ = nullptr;
  size_ = 0;
}

}  // namespace camd
