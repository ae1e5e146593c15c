#include "systemconfiguration/pam_entry.h"

#include <istream>
#include <ostream>
#include <utility>

#include "words.h"

namespace SystemConfiguration {
namespace {

void AppendToClosingBracket(std::istream& stream, std::string& control) {
  std::string word;
  do {
    stream >> word;
    if (stream.fail()) return;
    control.append(1, ' ').append(word);
  } while (word.back() != ']');
}

PAMControl ReadControl(std::istream& stream) {
  std::string control;
  stream >> control;
  const bool opensOnly = !control.empty() && control.front() == '[' && control.back() != ']';
  if (opensOnly) AppendToClosingBracket(stream, control);
  return PAMControl(control);
}

}  // namespace

PAMEntry::PAMEntry() = default;

PAMEntry::PAMEntry(PAMControl control, std::string module)
    : control_(std::move(control)), module_(std::move(module)) {}

const PAMControl& PAMEntry::control() const {
  return control_;
}

const std::string& PAMEntry::module() const {
  return module_;
}

std::list<std::string>& PAMEntry::parameters() {
  return parameters_;
}

const std::list<std::string>& PAMEntry::parameters() const {
  return parameters_;
}

bool PAMEntry::operator==(const PAMEntry& other) const {
  const PAMControl::Control ours = control_;
  const PAMControl::Control theirs = other.control_;
  return ours == theirs && module_ == other.module_ && parameters_ == other.parameters_;
}

std::ostream& operator<<(std::ostream& stream, const PAMEntry& entry) {
  stream << static_cast<std::string>(entry.control()) << '\t' << entry.module() << '\t';
  for (const std::string& parameter : entry.parameters()) stream << parameter << ' ';
  return stream;
}

std::istream& operator>>(std::istream& stream, PAMEntry& entry) {
  entry.control_ = ReadControl(stream);
  stream >> entry.module_;
  std::string rest;
  std::getline(stream, rest, '\n');
  if (!rest.empty()) AppendWords(rest, WhiteSpace(), entry.parameters_);
  return stream;
}

}  // namespace SystemConfiguration
