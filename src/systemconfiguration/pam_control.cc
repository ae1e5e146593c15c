#include "systemconfiguration/pam_control.h"

#include <optional>
#include <string_view>

#include "pam_keywords.h"
#include "systemconfiguration/exceptions.h"

namespace SystemConfiguration {
namespace {

constexpr std::string_view messagePrefix = "Invalid Control: ";

PAMControl::Control ControlOf(const std::string& text) {
  if (!text.empty() && text.front() == '[' && text.back() == ']') return PAMControl::Bracketed;
  if (const std::optional<PAMControl::Control> value = FindValue(controlKeywords, text)) return *value;
  throw InvalidControlException(MessageForUnknown(messagePrefix, text));
}

}  // namespace

PAMControl::PAMControl() : value_(Unset) {}

PAMControl::PAMControl(Control value) : value_(value) {}

PAMControl::PAMControl(Control value, const std::string& text) : value_(value), text_(text) {}

PAMControl::PAMControl(const std::string& text) : value_(ControlOf(text)) {
  if (value_ == Bracketed) text_ = text;
}

PAMControl& PAMControl::operator=(Control value) {
  value_ = value;
  return *this;
}

PAMControl& PAMControl::operator=(const std::string& text) {
  const Control value = ControlOf(text);
  if (value == Bracketed) text_ = text;
  value_ = value;
  return *this;
}

bool PAMControl::operator==(const PAMControl& other) const {
  return value_ == other.value_ && (value_ != Bracketed || text_ == other.text_);
}

bool PAMControl::operator==(Control value) const {
  return value_ == value;
}

bool PAMControl::operator==(const std::string& text) const {
  return value_ == Bracketed ? text_ == text : value_ == ControlOf(text);
}

PAMControl::operator std::string() const {
  if (value_ == Bracketed) return text_;
  if (const std::optional<std::string_view> keyword = FindText(controlKeywords, value_)) {
    return std::string(*keyword);
  }
  throw InvalidControlException(MessageWithoutKeyword(messagePrefix, value_));
}

PAMControl::operator Control() const {
  return value_;
}

}  // namespace SystemConfiguration
