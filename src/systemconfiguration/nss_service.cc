#include "systemconfiguration/nss_service.h"

#include <ostream>

namespace SystemConfiguration {

NSSService::NSSService(const std::string& module) : module_(module) {}

const std::string& NSSService::module() const {
  return module_;
}

std::list<std::string>& NSSService::parameters() {
  return parameters_;
}

const std::list<std::string>& NSSService::parameters() const {
  return parameters_;
}

bool NSSService::operator==(const NSSService& other) const {
  return module_ == other.module_ && parameters_ == other.parameters_;
}

std::ostream& operator<<(std::ostream& stream, const NSSService& service) {
  stream << service.module();
  const char* separator = " [";
  for (const std::string& parameter : service.parameters()) {
    stream << separator << parameter;
    separator = " ";
  }
  if (!service.parameters().empty()) stream << ']';
  return stream;
}

}  // namespace SystemConfiguration
