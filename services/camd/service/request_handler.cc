#include "service/request_handler.h"

#include <algorithm>

#include "common/status.h"
#include "service/database.h"

namespace camd {
namespace {

constexpr const char* kDomainPath = "/v1/domain";
constexpr const char* kComputersPath = "/v1/computers";
constexpr unsigned int kRetryWhenBusySeconds = 2;
constexpr size_t kLongestLoggedPath = 100;

// The HTTP status for a failure in the directory.
unsigned int HttpStatusOf(uint32_t status) {
  switch (status) {
    case kAccessDenied:
      return 403;
    case kInvalidContainer:
      return 400;
    case kAccountExists:
      return 409;
    case kNoLogonServers:
      return 502;
    case kTimeout:
      return 504;
    default:
      return 500;
  }
}

WebAnswer AnswerWith(const DomainInformation& information) {
  const nlohmann::json body = {{"netbiosDomainName", information.netbiosDomainName},
                               {"dnsDomainName", information.dnsDomainName},
                               {"domainSid", information.domainSid}};
  return {200, Secret(body.dump()), 0};
}

WebAnswer StoppingAnswer() {
  return FailureAnswer(503, kBusy, "the service is being stopped", kRetryWhenBusySeconds);
}

}  // namespace

void RequestHandler::Configure(std::shared_ptr<const Configuration> configuration) {
  const std::lock_guard lock(mutex_);
  configuration_ = std::move(configuration);
}

void RequestHandler::RefuseFurther() {
  const std::lock_guard lock(mutex_);
  refusing_ = std::chrono::steady_clock::now();
}

void RequestHandler::Handle(WebRequest request, Completion completion) {
  const auto task = std::make_shared<Task>();
  task->request = std::move(request);
  task->completion = std::move(completion);
  task->event = {
      {"client", task->request.client.Text()},
      {"request", (task->request.method + " " + task->request.path).substr(0, kLongestLoggedPath)}};
  bool refusing = false;
  {
    const std::lock_guard lock(mutex_);
    task->configuration = configuration_;
    refusing = refusing_.has_value();
  }
  if (refusing) return Finish(*task, StoppingAnswer());
  if (auto refusal = Refusal(task->request, task->configuration->access))
    return Finish(*task, std::move(*refusal));
  Route(task);
}

void RequestHandler::NoteBrokenOff(const Address& client, const std::string& request, bool whole) {
  audit_.Write(
      {{"client", client.Text()},
       {"request", request.substr(0, kLongestLoggedPath)},
       {"text", whole ? "the client did not wait for the answer" : "the request did not come whole"}});
}

// What is looked at before the request itself.
std::optional<WebAnswer> RequestHandler::Refusal(const WebRequest& request, const AccessSettings& access) {
  const bool allowed =
      std::any_of(access.clientAddresses.begin(), access.clientAddresses.end(),
                  [&request](const AddressRange& range) { return range.Contains(request.client); });
  if (!allowed)
    return FailureAnswer(403, kAccessDenied, "this address is not on the list of allowed clients");
  const unsigned int wait =
      rateLimit_.Count(request.client.Client(), access.requestsPerMinute, std::chrono::steady_clock::now());
  if (wait != 0) return FailureAnswer(429, kQuotaExceeded, "too many requests from this address", wait);
  if (request.bodyTooLong) return FailureAnswer(413, kInvalidParameter, "the body is too long");
  return std::nullopt;
}

void RequestHandler::Route(const std::shared_ptr<Task>& task) {
  const std::string& path = task->request.path;
  const std::string& method = task->request.method;
  if (path == kDomainPath && method == "GET") return HandleDomain(task);
  if (path == kComputersPath && method == "POST") return HandleCreation(task);
  const bool known = path == kDomainPath || path == kComputersPath;
  Finish(*task, known ? FailureAnswer(405, kNotSupported, "this path takes another method")
                      : FailureAnswer(404, kNotSupported, "there is no such path"));
}

void RequestHandler::HandleDomain(const std::shared_ptr<Task>& task) {
  const DirectorySettings& directory = task->configuration->directory;
  if (const auto recent = domain_.Recent(directory.domain)) return Finish(*task, AnswerWith(*recent));
  Enqueue(task, [this, task] { return AnswerWith(domain_.Get(task->configuration->directory)); });
}

void RequestHandler::HandleCreation(const std::shared_ptr<Task>& task) {
  const auto order = std::make_shared<AccountCreation::Order>();
  std::optional<WebAnswer> refusal;
  try {
    refusal = creation_.Check(*task, *order);
  } catch (const DatabaseError& error) {
    task->event["fault"] = error.what();
    refusal = FailureAnswer(500, kInternalError, "the service's ledger cannot be used");
  }
  if (refusal) return Finish(*task, std::move(*refusal));
  Enqueue(task, [this, task, order] { return creation_.Carry(*task, std::move(*order)); });
}

void RequestHandler::Enqueue(const std::shared_ptr<Task>& task, std::function<WebAnswer()> work) {
  const bool taken = queue_.TryAdd([this, task, work = std::move(work)] {
    if (IsTooLate(*task)) return Finish(*task, StoppingAnswer());
    FinishWith(*task, work);
  });
  if (!taken)
    Finish(*task, FailureAnswer(503, kBusy, "too many requests are waiting", kRetryWhenBusySeconds));
}

// Whether the service is being stopped and has gone on for so long that no further work may begin.
bool RequestHandler::IsTooLate(const Task& task) {
  const std::lock_guard lock(mutex_);
  return refusing_ &&
         std::chrono::steady_clock::now() > *refusing_ + task.configuration->directory.helperTimeout;
}

void RequestHandler::FinishWith(Task& task, const std::function<WebAnswer()>& work) {
  WebAnswer answer;
  try {
    answer = work();
  } catch (const Failure& failure) {
    answer = FailureAnswer(HttpStatusOf(failure.Code()), failure.Code(), failure.what());
  } catch (const DatabaseError& error) {
    task.event["fault"] = error.what();
    answer = FailureAnswer(500, kInternalError, "the service's ledger cannot be used");
  }
  Finish(task, std::move(answer));
}

void RequestHandler::Finish(Task& task, WebAnswer answer) {
  const auto elapsed = std::chrono::steady_clock::now() - task.begun;
  task.event["result"] = answer.httpStatus;
  task.event["milliseconds"] = std::chrono::duration_cast<std::chrono::milliseconds>(elapsed).count();
  if (answer.httpStatus >= 400) {
    const auto body = nlohmann::json::parse(answer.body.View(), nullptr, false);
    task.event["status"] = body.at("status");
    task.event["text"] = body.at("text");
  }
  audit_.Write(std::move(task.event));
  task.completion(std::move(answer));
}

}  // namespace camd
