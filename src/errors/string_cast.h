/// Numbers as text for messages, without regard to the process's locale.
#ifndef ERRORS_STRING_CAST_H
#define ERRORS_STRING_CAST_H

#include <array>
#include <charconv>
#include <limits>
#include <string>

namespace quenix::authentication {

/// The decimal text of `value`, without grouping.
template <class Integer>
std::string string_cast(Integer value) {
  std::array<char, std::numeric_limits<Integer>::digits10 + 2> digits;
  const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), value).ptr;
  return std::string(digits.data(), end);
}

}  // namespace quenix::authentication

#endif  // ERRORS_STRING_CAST_H
