/// The plug-in as the library drives it.
#ifndef TESTS_CAM_PLUGIN_H
#define TESTS_CAM_PLUGIN_H

#include <cstdint>
#include <ostream>
#include <string>

#include "authentication/plugin/cam_proxy_client.h"

namespace camtest {

inline const std::string LOOPBACK = "127.0.0.1";
inline const std::string SETTINGS = "/etc/quenix/velmor/cam.conf";

struct DomainResult {
  std::uint32_t status = 0;
  std::string netbios;
  std::string dns;
  std::string sid;

  bool operator==(const DomainResult&) const = default;
  friend std::ostream& operator<<(std::ostream& stream, const DomainResult& result) {
    return stream << result.status << ": " << result.netbios << ", " << result.dns << ", " << result.sid;
  }
};

struct AccountResult {
  std::uint32_t status = 0;
  std::string name;
  std::string blob;

  bool operator==(const AccountResult&) const = default;
  friend std::ostream& operator<<(std::ostream& stream, const AccountResult& result) {
    return stream << result.status << ": " << result.name << ", " << result.blob;
  }
};

/// The loaded plug-in, bound as the library binds it and closed at the end of the scope.
class Plugin {
 public:
  Plugin();
  Plugin(const Plugin&) = delete;
  Plugin& operator=(const Plugin&) = delete;
  ~Plugin();

  const struct CAMProxyClientOperations& Operations() const { return *operations_; }

  /// One call each, with the results copied and released. An empty thumbprint switches the verification off.
  DomainResult GetDomain(const std::string& thumbprint = "", const std::string& server = LOOPBACK) const;
  AccountResult Create(const std::string& hostName, const std::string& thumbprint = "",
                       const char* container = nullptr) const;

 private:
  void* handle_;
  const struct CAMProxyClientOperations* operations_;
};

/// Writes cam.conf, readable by its owner only: the port and these lines.
void WriteSettings(std::uint16_t port, const std::string& lines = "");

}  // namespace camtest

#endif  // TESTS_CAM_PLUGIN_H
