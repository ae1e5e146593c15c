/// One request to the service and its answer, over a TLS connection of its own.
#ifndef CAM_HTTPS_EXCHANGE_H
#define CAM_HTTPS_EXCHANGE_H

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "certificate_check.h"
#include "secret.h"

namespace camproxy {

using Clock = std::chrono::steady_clock;

struct Request {
  /// Without a body it is a GET, with one a POST.
  std::string path;
  SecretString body;
  SecretString token;
};

struct Answer {
  unsigned int httpStatus;
  std::optional<std::chrono::seconds> retryAfter;
  SecretString body;
};

/// Where to connect, and until when.
struct Target {
  std::string address;
  std::uint16_t port;
  Clock::time_point connectDeadline;
  Clock::time_point deadline;
};

/// Connects, sends the request once and waits for the whole answer, until the deadlines at the latest. Sends
/// nothing but the TLS handshake to a server that `check` refuses; a null check accepts every server.
///
/// May run on several threads at once. Raises no signal, starts no thread, looks at no environment variable.
/// Throws Failure for the statuses of connections in failure.h, WRONG_CERTIFICATE, and INVALID_DATA when the
/// answer is not HTTP or longer than 64 KiB; and std::bad_alloc.
Answer Exchange(const Target& target, CertificateCheck* check, const Request& request);

}  // namespace camproxy

#endif  // CAM_HTTPS_EXCHANGE_H
