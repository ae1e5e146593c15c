#include "stores/host_name.h"

#include <netdb.h>
#include <unistd.h>

#include <array>
#include <cstring>

#include "authentication/library_exceptions.h"

namespace quenix::authentication {

std::string LocalHostName() {
  std::array<char, 64> buffer{};
  if (gethostname(buffer.data(), buffer.size()) != 0) {
    throw InvalidHostNameException("unable to get hostname");
  }
  // A name that fills the buffer need not be terminated.
  return std::string(buffer.data(), strnlen(buffer.data(), buffer.size()));
}

std::string CanonicalHostName(const std::string& hostName) {
  std::array<char, 1024> work{};
  hostent entry{};
  hostent* result = nullptr;
  int resolverError = 0;
  if (gethostbyname_r(hostName.c_str(), &entry, work.data(), work.size(), &result, &resolverError) != 0) {
    throw InvalidHostNameException(hstrerror(resolverError));
  }
  if (result == nullptr) throw InvalidHostNameException("hostname cannot be resolved");
  return result->h_name;
}

std::string FirstLabel(const std::string& name) {
  return name.substr(0, name.find('.'));
}

}  // namespace quenix::authentication
