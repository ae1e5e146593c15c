// The service's configuration file, camd.conf(5).
#ifndef CAMD_SERVICE_CONFIGURATION_H
#define CAMD_SERVICE_CONFIGURATION_H

#include <chrono>
#include <cstdint>
#include <stdexcept>
#include <string>
#include <vector>

#include "service/address_range.h"
#include "service/host_name.h"

namespace camd {

// A configuration file that cannot be used; the text names the file, where it can the line, and the fault.
class ConfigurationError : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// What takes effect only when the service starts.
struct ServerSettings {
  std::string listenAddress = "0.0.0.0";
  uint16_t port = 8443;
  std::string certificateFile;
  std::string keyFile;
  std::string ledgerFile = "/var/lib/velmor-camd/ledger.db";
  unsigned int connections = 512;
  unsigned int connectionsPerClient = 32;
  std::chrono::seconds requestTimeout{10};
  unsigned int helpers = 4;
  unsigned int queueLength = 64;

  bool operator==(const ServerSettings& other) const = default;
};

enum class ExistingAccounts { kRefuse, kOwnUnused, kAny };

struct DirectorySettings {
  std::string domain;
  std::string controller;
  std::string user;
  std::string passwordFile;
  std::string defaultContainer;
  ExistingAccounts existingAccounts = ExistingAccounts::kRefuse;
  std::chrono::hours removeUnusedAfter{0};
  std::string helper = "/usr/libexec/velmor/velmor-camd-helper";
  std::chrono::seconds helperTimeout{45};
};

struct AccessSettings {
  std::vector<std::string> hostNames;
  std::vector<AddressRange> clientAddresses;
  bool tokenRequired = false;
  unsigned int requestsPerMinute = 60;
  unsigned int accountsPerDay = 20;
};

struct Configuration {
  ServerSettings server;
  DirectorySettings directory;
  AccessSettings access;
  std::string auditFile;
};

// Reads and checks the file; unknown keys and values out of range are errors. Throws ConfigurationError.
Configuration ReadConfiguration(const std::string& path);

}  // namespace camd

#endif  // CAMD_SERVICE_CONFIGURATION_H
