// What the service does with a request: who may ask, which path means what, and what is written about it.
#ifndef CAMD_SERVICE_REQUEST_HANDLER_H
#define CAMD_SERVICE_REQUEST_HANDLER_H

#include <chrono>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "service/account_creation.h"
#include "service/audit_log.h"
#include "service/configuration.h"
#include "service/domain_cache.h"
#include "service/exchange.h"
#include "service/rate_limit.h"
#include "service/task.h"
#include "service/work_queue.h"

namespace camd {

// Safe for use by several threads.
class RequestHandler {
 public:
  using Completion = std::function<void(WebAnswer)>;

  // All references must outlive the handler, which may end when every request has its answer.
  RequestHandler(AccountCreation& creation, DomainCache& domain, AuditLog& audit, WorkQueue& queue)
      : creation_(creation), domain_(domain), audit_(audit), queue_(queue) {}

  // Takes effect for requests that begin from now on. Must have been called before the first request.
  void Configure(std::shared_ptr<const Configuration> configuration);

  // Refuses every further request, so that the ones under way can be waited for. One whose turn comes later
  // than after the time that one request may take is told to come again.
  void RefuseFurther();

  // Answers a request: calls `completion` once, on this thread before the return or on another one later.
  // Does not wait for the directory. Writes one line to the audit log.
  void Handle(WebRequest request, Completion completion);

  // Notes that the client did not wait for its answer, or that its request did not come whole.
  void NoteBrokenOff(const Address& client, const std::string& request, bool whole);

 private:
  std::optional<WebAnswer> Refusal(const WebRequest& request, const AccessSettings& access);
  void Route(const std::shared_ptr<Task>& task);
  void HandleDomain(const std::shared_ptr<Task>& task);
  void HandleCreation(const std::shared_ptr<Task>& task);
  void Enqueue(const std::shared_ptr<Task>& task, std::function<WebAnswer()> work);
  void FinishWith(Task& task, const std::function<WebAnswer()>& work);
  bool IsTooLate(const Task& task);
  void Finish(Task& task, WebAnswer answer);

  AccountCreation& creation_;
  DomainCache& domain_;
  AuditLog& audit_;
  WorkQueue& queue_;
  RateLimit rateLimit_;
  std::mutex mutex_;
  std::shared_ptr<const Configuration> configuration_;
  // Since when further requests are refused.
  std::optional<std::chrono::steady_clock::time_point> refusing_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_REQUEST_HANDLER_H
