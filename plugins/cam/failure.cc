#include "failure.h"

namespace camproxy {

Failure::Failure(std::uint32_t status, const std::string& text) : std::runtime_error(text), status_(status) {}
Failure::Failure(const Failure& other) = default;
Failure::~Failure() = default;

}  // namespace camproxy
