#include "systemconfiguration/pam_policy.h"

#include <cctype>
#include <istream>
#include <limits>
#include <ostream>
#include <string_view>
#include <utility>

#include "buffered_input.h"
#include "pam_line_reader.h"

namespace SystemConfiguration {
namespace {

using Traits = std::istream::traits_type;

// One look at each character: looking again at the end of the file would make the stream fail.
Traits::int_type PeekBehindWhiteSpace(std::istream& stream) {
  Traits::int_type next = stream.peek();
  while (std::isspace(next) != 0) {
    stream.ignore();
    next = stream.peek();
  }
  return next;
}

void SkipLine(std::istream& stream) {
  stream.ignore(std::numeric_limits<std::streamsize>::max(), '\n');
}

// The common case of ReadLine, many times over.
void ReadBufferedLines(BufferedInput& input, PAMLineReader& lines) {
  for (std::string_view line = input.Line(); lines.Append(line); line = input.Line()) input.Consume(line);
}

void ReadLine(std::istream& stream, PAMPolicy& policy) {
  PAMFacility facility;
  PAMEntry entry;
  stream >> facility >> entry;
  policy[facility].push_back(std::move(entry));
}

}  // namespace

PAMPolicy::PAMPolicy(const std::string& name) : name_(name) {}

const std::string& PAMPolicy::name() const {
  return name_;
}

PAMStack& PAMPolicy::operator[](PAMFacility facility) {
  return stacks_.try_emplace(facility, facility).first->second;
}

std::ostream& operator<<(std::ostream& stream, const PAMPolicy& policy) {
  stream << "#%PAM-1.0" << std::endl << std::endl;
  for (const auto& [facility, stack] : policy.stacks_) stream << stack << std::endl;
  return stream;
}

std::istream& operator>>(std::istream& stream, PAMPolicy& policy) {
  BufferedInput input(stream);
  PAMLineReader lines(policy);
  while (!stream.fail()) {
    ReadBufferedLines(input, lines);
    const Traits::int_type next = PeekBehindWhiteSpace(stream);
    if (Traits::eq_int_type(next, Traits::eof())) break;
    if (next == '#') {
      SkipLine(stream);
    } else {
      ReadLine(stream, policy);
    }
  }
  return stream;
}

}  // namespace SystemConfiguration
