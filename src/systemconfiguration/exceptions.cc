#include "systemconfiguration/exceptions.h"

namespace SystemConfiguration {

InvalidControlException::InvalidControlException(const std::string& message) : message_(message) {}

InvalidControlException::~InvalidControlException() = default;

const char* InvalidControlException::what() const noexcept {
  return message_.c_str();
}

InvalidFacilityException::InvalidFacilityException(const std::string& message) : message_(message) {}

InvalidFacilityException::~InvalidFacilityException() = default;

const char* InvalidFacilityException::what() const noexcept {
  return message_.c_str();
}

InvalidDatabaseException::InvalidDatabaseException(const std::string& message) : message_(message) {}

InvalidDatabaseException::~InvalidDatabaseException() = default;

const char* InvalidDatabaseException::what() const noexcept {
  return message_.c_str();
}

}  // namespace SystemConfiguration
