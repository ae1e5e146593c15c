// A request and its answer, as the rest of the service sees them.
#ifndef CAMD_SERVICE_EXCHANGE_H
#define CAMD_SERVICE_EXCHANGE_H

#include <cstdint>
#include <string>

#include "common/secret.h"
#include "service/address_range.h"

namespace camd {

struct WebRequest {
  Address client;
  std::string method;
  std::string path;
  std::string body;
  bool bodyTooLong = false;
  Secret token;
};

struct WebAnswer {
  unsigned int httpStatus = 200;
  // JSON; wiped when it has been sent.
  Secret body;
  unsigned int retryAfterSeconds = 0;
};

// An answer that tells of a failure; see docs/cam-protocol.md.
WebAnswer FailureAnswer(unsigned int httpStatus, uint32_t status, const std::string& text,
                        unsigned int retryAfterSeconds = 0);

}  // namespace camd

#endif  // CAMD_SERVICE_EXCHANGE_H
