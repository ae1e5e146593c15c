#include "systemconfiguration/pam_stack.h"

#include <algorithm>
#include <ostream>

#include "systemconfiguration/exceptions.h"

namespace SystemConfiguration {
namespace {

// Saves the allocations by which a text grows.
constexpr std::size_t ordinaryLineLength = 128;

// The same as writing facility, entry and line end one after the other, at a fraction of the cost. Only the
// first word goes through the stream by itself: the stream's width is meant for it.
void WriteLine(std::ostream& stream, const std::string& facility, const PAMEntry& entry, std::string& rest) {
  stream << facility;
  rest.assign(1, '\t');
  try {
    rest.append(static_cast<std::string>(entry.control()));
  } catch (const InvalidControlException&) {
    stream << rest;
    throw;
  }
  rest.append(1, '\t').append(entry.module()).append(1, '\t');
  for (const std::string& parameter : entry.parameters()) rest.append(parameter).append(1, ' ');
  rest.append(1, '\n');
  stream.write(rest.data(), static_cast<std::streamsize>(rest.size())).flush();
}

}  // namespace

PAMStack::PAMStack() = default;

PAMStack::PAMStack(const PAMFacility& facility) : facility_(facility) {}

PAMFacility PAMStack::Facility() const {
  return facility_;
}

PAMStack::iterator PAMStack::find(const std::string& module) {
  return std::find_if(begin(), end(), [&](const PAMEntry& entry) { return entry.module() == module; });
}

PAMStack::const_iterator PAMStack::find(const std::string& module) const {
  return std::find_if(begin(), end(), [&](const PAMEntry& entry) { return entry.module() == module; });
}

std::ostream& operator<<(std::ostream& stream, const PAMStack& stack) {
  if (stack.empty()) return stream;
  const std::string facility = stack.Facility();
  std::string rest;
  rest.reserve(ordinaryLineLength);
  for (const PAMEntry& entry : stack) WriteLine(stream, facility, entry, rest);
  return stream;
}

}  // namespace SystemConfiguration
