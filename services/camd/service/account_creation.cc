#include "service/account_creation.h"

#include <algorithm>
#include <ctime>
#include <utility>

#include "common/status.h"
#include "service/host_name.h"

namespace camd {
namespace {

constexpr int64_t kSecondsPerDay = 24 * 60 * 60;
constexpr unsigned int kRetryQuotaSeconds = 3600;
constexpr unsigned int kRetryUnderWaySeconds = 2;
constexpr size_t kLongestContainer = 1024;

// Reads the two fields; false when the body is not what it should be.
bool ReadBody(const std::string& body, AccountCreation::Order& order) {
  const auto fields = nlohmann::json::parse(body, nullptr, false);
  if (!fields.is_object()) return false;
  const auto hostName = fields.find("hostName");
  if (hostName == fields.end() || !hostName->is_string()) return false;
  order.hostName = hostName->get<std::string>();
  const auto container = fields.find("container");
  if (container == fields.end() || container->is_null()) return true;
  if (!container->is_string()) return false;
  order.container = container->get<std::string>();
  return order.container.size() <= kLongestContainer && order.container.find('\0') == std::string::npos;
}

// Put together in wiped memory, since it holds the blob.
WebAnswer AnswerWith(const CreatedAccount& created) {
  const std::string before =
      R"({"accountName": )" + nlohmann::json(created.account.accountName).dump() + R"(, "joinBlob": ")";
  const std::string_view after = "\"}";
  const std::string_view blob = created.joinBlob.View();
  Secret body(before.size() + blob.size() + after.size());
  char* end = std::copy(before.begin(), before.end(), body.Data());
  end = std::copy(blob.begin(), blob.end(), end);
  std::copy(after.begin(), after.end(), end);
  return {201, std::move(body), 0};
}

}  // namespace

std::optional<WebAnswer> AccountCreation::Check(Task& task, Order& order) {
  if (!ReadBody(task.request.body, order)) {
    return FailureAnswer(400, kInvalidParameter, "the body is not an object of JSON with a hostName");
  }
  task.event["hostName"] = order.hostName.substr(0, 253);
  if (!order.container.empty()) task.event["container"] = order.container;
  if (order.container.empty()) order.container = task.configuration->directory.defaultContainer;
  order.computer = IsHostName(order.hostName) ? ComputerNameOf(order.hostName) : std::string();
  if (order.computer.empty()) {
    return FailureAnswer(
        400, kInvalidComputerName,
        "the host name cannot be a computer name: its first part must have 1 to 15 letters, digits "
        "and hyphens, not only digits, and no hyphen at an end");
  }
  if (auto refusal = CheckToken(task, order)) return refusal;
  if (!order.tokenId.empty()) task.event["token"] = order.tokenId;
  if (!FitsAnyPattern(order.hostName, task.configuration->access.hostNames)) {
    return FailureAnswer(403, kAccessDenied, "the name is not on the list of allowed names");
  }
  order.reservation = Reserve(order.computer);
  if (!order.reservation) {
    return FailureAnswer(409, kAlreadyUnderWay, "an account of that name is being made or removed",
                         kRetryUnderWaySeconds);
  }
  return std::nullopt;
}

// The order is this operation's own, so that its name is free again before the client has the answer.
WebAnswer AccountCreation::Carry(const Task& task, Order&& handedOver) {
  const Order order = std::move(handedOver);
  const int64_t now = time(nullptr);
  const AccountRequest request = {order.computer, order.hostName, order.container,
                                  task.request.client.Client().Text(), order.tokenId};
  const auto id =
      ledger_.Begin(request, now, now - kSecondsPerDay, task.configuration->access.accountsPerDay);
  if (!id) {
    return FailureAnswer(429, kQuotaExceeded, "this client has had its accounts for the day",
                         kRetryQuotaSeconds);
  }
  // Behind what may fail before the creation begins, so that no token is used up for nothing.
  if (!order.tokenId.empty() && !tokens_.Claim(order.tokenId, order.hostName, now)) {
    ledger_.Fail(*id, kLogonFailure, now);
    return FailureAnswer(401, kLogonFailure, "the token has been used");
  }
  return CarryEntered(task, order, *id);
}

std::optional<WebAnswer> AccountCreation::CheckToken(const Task& task, Order& order) {
  if (!task.configuration->access.tokenRequired) return std::nullopt;
  const auto token = tokens_.Find(task.request.token.View(), time(nullptr));
  if (!token)
    return FailureAnswer(401, kLogonFailure, "a token is wanted that is known, unused and not out of date");
  if (!token->hostName.empty() && !FitsAnyPattern(order.hostName, {token->hostName})) {
    return FailureAnswer(403, kAccessDenied, "the token is for another name");
  }
  order.tokenId = token->id;
  return std::nullopt;
}

std::shared_ptr<void> AccountCreation::Reserve(const std::string& computer) {
  const std::lock_guard lock(mutex_);
  if (!reserved_.insert(computer).second) return nullptr;
  return std::shared_ptr<void>(this, [this, computer](void*) {
    const std::lock_guard releaseLock(mutex_);
    reserved_.erase(computer);
  });
}

WebAnswer AccountCreation::CarryEntered(const Task& task, const Order& order, int64_t id) {
  try {
    const CreatedAccount created = directory_.CreateAccount(
        task.configuration->directory, order.computer, order.container, ledger_.FindLatest(order.computer));
    ledger_.Give(id, created.account, time(nullptr));
    return AnswerWith(created);
  } catch (const Failure& failure) {
    // Of a helper that died or was ended nobody knows how far it got, so its entry stays to be looked at.
    const bool unknown = failure.Code() == kTimeout || failure.Code() == kHelperDied;
    if (unknown) {
      ledger_.Interrupt(id, time(nullptr));
    } else {
      ledger_.Fail(id, failure.Code(), time(nullptr));
    }
    if (!order.tokenId.empty()) tokens_.Release(order.tokenId);
    throw;
  }
}

}  // namespace camd
