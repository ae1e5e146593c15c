#include "common/secret.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace sambaprovider {

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

void Secret::Wipe() {
  if (data_ == nullptr) return;
  explicit_bzero(data_, size_ + 1);
  delete[] data_;
  data_ = nullptr;
}

}  // namespace sambaprovider
