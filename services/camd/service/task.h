// One request from its arrival to its answer.
#ifndef CAMD_SERVICE_TASK_H
#define CAMD_SERVICE_TASK_H

#include <chrono>
#include <functional>
#include <memory>
#include <nlohmann/json.hpp>

#include "service/configuration.h"
#include "service/exchange.h"

namespace camd {

struct Task {
  WebRequest request;
  std::function<void(WebAnswer)> completion;
  // The one that was in force when the request came.
  std::shared_ptr<const Configuration> configuration;
  std::chrono::steady_clock::time_point begun = std::chrono::steady_clock::now();
  // What the audit log says beside the outcome.
  nlohmann::json event;
};

}  // namespace camd

#endif  // CAMD_SERVICE_TASK_H
