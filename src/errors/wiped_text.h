/// The end of a secret.
#ifndef ERRORS_WIPED_TEXT_H
#define ERRORS_WIPED_TEXT_H

#include <cstring>
#include <string>

namespace quenix::authentication {

/// Overwrites a text at the end of a block.
class WipeAtEnd {
 public:
  explicit WipeAtEnd(std::string& text) : text_(text) {}
  WipeAtEnd(const WipeAtEnd&) = delete;
  WipeAtEnd& operator=(const WipeAtEnd&) = delete;
  ~WipeAtEnd() { explicit_bzero(text_.data(), text_.size()); }

 private:
  std::string& text_;
};

}  // namespace quenix::authentication

#endif  // ERRORS_WIPED_TEXT_H
