#include "authentication/configuration.h"

#include <cerrno>
#include <fstream>
#include <utility>

#include "authentication/library_exceptions.h"
#include "config/atomic_file_stream.h"
#include "config/key_value_parser.h"
#include "errors/system_text.h"

namespace quenix::authentication {

namespace {

bool IsBlank(const std::string& line) {
  return line.find_first_not_of(blanks) == std::string::npos;
}

[[noreturn]] void ThrowIOError(const char* action, const std::string& path) {
  const std::string reason = SystemText(errno);
  throw IOError(std::string("Unable to ") + action + " '" + path + "': " + reason);
}

}  // namespace

Configuration::Configuration(const std::string& path) : path_(path) {
  std::ifstream file(path_);
  if (!file.is_open()) ThrowIOError("open", path_);
  int lineNumber = 0;
  for (std::string line; std::getline(file, line);) {
    ++lineNumber;
    if (!IsBlank(line)) insert(GetKeyValuePair(line, lineNumber));
  }
  if (file.bad()) ThrowIOError("read", path_);
}

Configuration::Configuration(const Configuration& other) = default;
Configuration& Configuration::operator=(const Configuration& other) = default;
Configuration::~Configuration() = default;

const std::string& Configuration::operator[](const std::string& key) const {
  const auto entry = find(key);
  if (entry == end()) throw InvalidKeyException(key);
  return entry->second;
}

std::string& Configuration::operator[](const std::string& key) {
  return const_cast<std::string&>(std::as_const(*this)[key]);
}

void Configuration::Write() const {
  AtomicFileStream file(path_.c_str(), std::ios_base::out);
  for (const auto& [key, value] : *this) file << key << " = \"" << value << '"' << std::endl;
  if (!file) ThrowIOError("write", path_);
  file.Commit();
}

AuthenticationConfiguration::AuthenticationConfiguration()
    : Configuration("/etc/quenix/velmor/authentication.conf") {}
AuthenticationConfiguration::~AuthenticationConfiguration() = default;

ProviderConfiguration::ProviderConfiguration() : Configuration("/etc/quenix/velmor/provider.conf") {}
ProviderConfiguration::~ProviderConfiguration() = default;

CAMProviderConfiguration::CAMProviderConfiguration() : Configuration("/etc/quenix/velmor/camprovider.conf") {}
CAMProviderConfiguration::~CAMProviderConfiguration() = default;

}  // namespace quenix::authentication
