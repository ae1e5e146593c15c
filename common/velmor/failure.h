/// A step that did not work.
#ifndef VELMOR_FAILURE_H
#define VELMOR_FAILURE_H

#include <cstdint>
#include <stdexcept>
#include <string>

namespace velmor {

/// Carries a status, a code of the Windows system and network-management errors, to where it is given out.
/// `what()` is one line for a log and never holds a secret.
class Failure : public std::runtime_error {
 public:
  Failure(uint32_t status, const std::string& text) : std::runtime_error(text), status_(status) {}

  uint32_t Code() const { return status_; }

 private:
  uint32_t status_;
};

}  // namespace velmor

#endif  // VELMOR_FAILURE_H
