#include "common/message.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>

#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr size_t kLongestLine = 1024 * 1024;
constexpr size_t kLongestSecret = 1024 * 1024;

// One byte at a time, so that no byte of the secret reaches memory that is not wiped.
std::string ReadLine() {
  std::string line;
  for (char byte = 0; line.size() < kLongestLine;) {
    const ssize_t count = read(STDIN_FILENO, &byte, 1);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) break;
    if (byte == '\n') return line;
    line += byte;
  }
  throw Failure(kInvalidParameter, "the request is not a line");
}

velmor::Secret ReadSecret(size_t size) {
  if (size > kLongestSecret) throw Failure(kInvalidParameter, "the secret is too long");
  velmor::Secret secret(size);
  for (size_t done = 0; done < size;) {
    const ssize_t count = read(STDIN_FILENO, secret.Data() + done, size - done);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) throw Failure(kInvalidParameter, "the secret was cut off");
    done += static_cast<size_t>(count);
  }
  return secret;
}

bool IsAnswer(const nlohmann::json& fields) {
  return fields.is_object() && fields.contains("status") && fields["status"].is_number_unsigned() &&
         fields.contains("text") && fields["text"].is_string();
}

}  // namespace

std::string Request::Text(const char* field) const {
  try {
    return fields.value(field, std::string());
  } catch (const nlohmann::json::exception&) {
    throw Failure(kInvalidParameter, std::string("the field ") + field + " is no text");
  }
}

Answer Ask(const std::string& program, ChildGroup group, ChildEnvironment environment, const Request& request,
           std::chrono::milliseconds limit) {
  nlohmann::json fields = request.fields;
  fields["secretSize"] = request.secret.Size();
  std::string line;
  try {
    line = fields.dump();
  } catch (const nlohmann::json::exception&) {
    throw Failure(kInvalidParameter, "a name is not valid UTF-8");
  }
  const Conversation conversation = Converse(program, group, environment, line, request.secret.View(), limit);
  Answer answer{conversation.end, {}};
  if (answer.end != Conversation::End::kAnswered) return answer;
  answer.fields = nlohmann::json::parse(conversation.answer, nullptr, false);
  if (!IsAnswer(answer.fields)) answer.end = Conversation::End::kDied;
  return answer;
}

Request ReceiveRequest() {
  Request request;
  request.fields = nlohmann::json::parse(ReadLine(), nullptr, false);
  if (!request.fields.is_object() || !request.fields.contains("secretSize") ||
      !request.fields["secretSize"].is_number_unsigned()) {
    throw Failure(kInvalidParameter, "the request is not understood");
  }
  request.secret = ReadSecret(request.fields["secretSize"].get<size_t>());
  return request;
}

void SendAnswer(const nlohmann::json& fields) {
  const std::string line = fields.dump(-1, ' ', false, nlohmann::json::error_handler_t::replace) + "\n";
  for (size_t done = 0; done < line.size();) {
    const ssize_t count = send(STDOUT_FILENO, line.data() + done, line.size() - done, MSG_NOSIGNAL);
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return;
    done += static_cast<size_t>(count);
  }
}

bool CallerHasGone() {
  pollfd entry = {STDIN_FILENO, POLLRDHUP, 0};
  return poll(&entry, 1, 0) > 0;
}

}  // namespace sambaprovider
