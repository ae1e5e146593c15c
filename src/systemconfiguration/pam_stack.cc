#include "systemconfiguration/pam_stack.h"

#include <algorithm>
#include <ostream>

namespace SystemConfiguration {

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
  for (const PAMEntry& entry : stack) stream << stack.Facility() << '\t' << entry << std::endl;
  return stream;
}

}  // namespace SystemConfiguration
