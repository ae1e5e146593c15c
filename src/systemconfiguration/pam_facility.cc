#include "systemconfiguration/pam_facility.h"

#include <istream>
#include <optional>
#include <ostream>
#include <string_view>

#include "pam_keywords.h"
#include "systemconfiguration/exceptions.h"

namespace SystemConfiguration {
namespace {

constexpr std::string_view messagePrefix = "Invalid Facility: ";

PAMFacility::Facility FacilityOf(const std::string& word) {
  if (const std::optional<PAMFacility::Facility> value = FindValue(facilityKeywords, word)) return *value;
  throw InvalidFacilityException(MessageForUnknown(messagePrefix, word));
}

}  // namespace

PAMFacility::PAMFacility() : value_(Unset) {}

PAMFacility::PAMFacility(Facility value) : value_(value) {}

PAMFacility::PAMFacility(const std::string& word) : value_(FacilityOf(word)) {}

PAMFacility& PAMFacility::operator=(Facility value) {
  value_ = value;
  return *this;
}

PAMFacility& PAMFacility::operator=(const std::string& word) {
  value_ = FacilityOf(word);
  return *this;
}

bool PAMFacility::operator==(const PAMFacility& other) const {
  return value_ == other.value_;
}

bool PAMFacility::operator==(Facility value) const {
  return value_ == value;
}

bool PAMFacility::operator==(const std::string& word) const {
  return value_ == FacilityOf(word);
}

PAMFacility::operator std::string() const {
  if (const std::optional<std::string_view> keyword = FindText(facilityKeywords, value_)) {
    return std::string(*keyword);
  }
  throw InvalidFacilityException(MessageWithoutKeyword(messagePrefix, value_));
}

PAMFacility::operator Facility() const {
  return value_;
}

std::ostream& operator<<(std::ostream& stream, const PAMFacility& facility) {
  return stream << static_cast<std::string>(facility);
}

std::istream& operator>>(std::istream& stream, PAMFacility& facility) {
  std::string word;
  stream >> word;
  facility = word;
  return stream;
}

}  // namespace SystemConfiguration
