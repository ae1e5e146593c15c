/// The statuses that the plug-in gives out, and the exception that carries one inside it.
#ifndef CAM_FAILURE_H
#define CAM_FAILURE_H

#include <cstdint>
#include <stdexcept>
#include <string>

namespace camproxy {

/// Codes of the Windows system, network and security errors; docs/cam-plugin.md says when each is given.
enum Status : std::uint32_t {
  SUCCESS = 0,
  OUT_OF_MEMORY = 8,
  INVALID_DATA = 13,
  UNEXPECTED_NETWORK_ERROR = 59,
  INVALID_PARAMETER = 87,
  SETTINGS_FAULT = 1064,
  CONNECTION_REFUSED = 1225,
  NO_ROUTE = 1229,
  CONNECTION_BROKEN = 10054,
  TIMED_OUT = 10060,
  WRONG_CERTIFICATE = 0x80090325,
  NO_COMMON_TLS = 0x80090326,
};

/// What ends a call. The text is one line for the system log and never holds a secret.
class Failure : public std::runtime_error {
 public:
  Failure(std::uint32_t status, const std::string& text);
  Failure(const Failure& other);
  ~Failure() override;

  std::uint32_t GetStatus() const noexcept { return status_; }

 private:
  std::uint32_t status_;
};

}  // namespace camproxy

#endif  // CAM_FAILURE_H
