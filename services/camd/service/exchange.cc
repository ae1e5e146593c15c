#include "service/exchange.h"

#include <nlohmann/json.hpp>

namespace camd {

WebAnswer FailureAnswer(unsigned int httpStatus, uint32_t status, const std::string& text,
                        unsigned int retryAfterSeconds) {
  const nlohmann::json body = {{"status", status}, {"text", text}};
  return {httpStatus, Secret(body.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace)),
          retryAfterSeconds};
}

}  // namespace camd
