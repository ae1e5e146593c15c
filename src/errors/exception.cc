#include "authentication/exception.h"

#include <array>
#include <cstdio>

#include "errors/exception_operations.h"

namespace quenix::authentication {

namespace {

std::string MessageWithCode(unsigned long code, const std::string& message) {
  std::array<char, 2 * sizeof(code) + 1> digits{};
  std::snprintf(digits.data(), digits.size(), "%08lx", code);
  return std::string("Exception 0x") + digits.data() + ": " + message;
}

}  // namespace

Exception::Exception(const std::string& message) : code_(0), message_(message) {}

Exception::Exception(unsigned long code, const std::string& message)
    : code_(code), message_(MessageWithCode(code, message)) {}

const char* Exception::what() const noexcept {
  return message_.c_str();
}

VELMOR_DEFINE_EXCEPTION_OPERATIONS(Exception)

}  // namespace quenix::authentication
