#include "velmor/secret.h"

#include <sys/mman.h>

#include <algorithm>
#include <cstring>
#include <new>
#include <utility>

namespace velmor {

Secret::Secret(std::string_view text) : Secret(text.size()) {
  std::copy(text.begin(), text.end(), data_);
}

Secret::Secret(std::size_t size) {
  // Many a request brings no secret; that is not worth a page and three system calls.
  if (size == 0) return;
  size_ = size;
  mappedSize_ = size + 1;
  void* const memory = mmap(nullptr, mappedSize_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
  if (memory == MAP_FAILED) throw std::bad_alloc();
  data_ = static_cast<char*>(memory);
  // Both fail where limits forbid them; the bytes are wiped in any case.
  mlock(data_, mappedSize_);
  madvise(data_, mappedSize_, MADV_DONTDUMP);
}

Secret::Secret(Secret&& other) noexcept
    : data_(std::exchange(other.data_, nullptr)),
      size_(std::exchange(other.size_, 0)),
      mappedSize_(std::exchange(other.mappedSize_, 0)) {}

Secret& Secret::operator=(Secret&& other) noexcept {
  if (this != &other) {
    Release();
    data_ = std::exchange(other.data_, nullptr);
    size_ = std::exchange(other.size_, 0);
    mappedSize_ = std::exchange(other.mappedSize_, 0);
  }
  return *this;
}

Secret::~Secret() {
  Release();
}

void Secret::Shorten(std::size_t size) {
  if (size >= size_) return;
  explicit_bzero(data_ + size, size_ - size);
  size_ = size;
}

void Secret::Release() {
  if (data_ == nullptr) return;
  explicit_bzero(data_, mappedSize_);
  munmap(data_, mappedSize_);
}

}  // namespace velmor
