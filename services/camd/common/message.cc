#include "common/message.h"

#include <signal.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <exception>
#include <functional>

#include "common/child.h"
#include "common/status.h"

namespace camd {
namespace {

constexpr size_t kLongestLine = 64 * 1024;
constexpr size_t kLongestSecret = 1024 * 1024;

// Reads up to `size` bytes to the address; returns how many, 0 at the end.
using Reader = std::function<size_t(char*, size_t)>;

// One byte at a time, so that no byte of the secret reaches memory that is not wiped.
std::string ReadLine(const Reader& read) {
  std::string line;
  for (char byte = 0; line.size() < kLongestLine && read(&byte, 1) == 1;) {
    if (byte == '\n') return line;
    line += byte;
  }
  throw Failure(kInvalidParameter, "the message is not a line");
}

Message ReadMessage(const Reader& read) {
  Message message;
  message.fields = nlohmann::json::parse(ReadLine(read), nullptr, false);
  const int64_t size = message.Number("secretSize");
  if (!message.fields.is_object() || size < 0 || size > static_cast<int64_t>(kLongestSecret)) {
    throw Failure(kInvalidParameter, "the message is not understood");
  }
  message.secret = Secret(static_cast<size_t>(size));
  for (size_t done = 0; done < message.secret.Size();) {
    const size_t count = read(message.secret.Data() + done, message.secret.Size() - done);
    if (count == 0) throw Failure(kInvalidParameter, "the secret was cut off");
    done += count;
  }
  return message;
}

std::string LineOf(const Message& message) {
  nlohmann::json fields = message.fields;
  fields["secretSize"] = message.secret.Size();
  return fields.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace) + "\n";
}

size_t ReadInput(char* bytes, size_t size) {
  for (;;) {
    const ssize_t count = read(STDIN_FILENO, bytes, size);
    if (count < 0 && errno == EINTR) continue;
    return count <= 0 ? 0 : static_cast<size_t>(count);
  }
}

void WriteOutput(std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t count = write(STDOUT_FILENO, bytes.data(), bytes.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) return;
    bytes.remove_prefix(static_cast<size_t>(count));
  }
}

}  // namespace

std::string Message::Text(const char* field) const {
  const auto found = fields.find(field);
  return found != fields.end() && found->is_string() ? found->get<std::string>() : std::string();
}

int64_t Message::Number(const char* field) const {
  const auto found = fields.find(field);
  return found != fields.end() && found->is_number_integer() ? found->get<int64_t>() : 0;
}

Message Ask(const std::string& program, const Message& request, std::chrono::milliseconds limit) {
  const Deadline deadline = std::chrono::steady_clock::now() + limit;
  Child child(program);
  Message answer;
  try {
    // A program that has gone, or that does not read, may have answered all the same.
    if (child.Send(LineOf(request), deadline)) child.Send(request.secret.View(), deadline);
    answer = ReadMessage(
        [&child, deadline](char* bytes, size_t size) { return child.Receive(bytes, size, deadline); });
  } catch (const Failure& failure) {
    if (failure.Code() != kInvalidParameter) throw;
    throw Failure(kHelperDied, "the helper ended without an answer");
  }
  const auto status = answer.fields.find("status");
  if (status == answer.fields.end() || !status->is_number_unsigned()) {
    throw Failure(kHelperDied, "the helper's answer is not understood");
  }
  if (status->get<uint32_t>() != kSuccess) throw Failure(status->get<uint32_t>(), answer.Text("text"));
  return answer;
}

Message ReceiveRequest() {
  return ReadMessage(ReadInput);
}

void SendAnswer(const Message& answer) {
  WriteOutput(LineOf(answer));
  WriteOutput(answer.secret.View());
}

int ServeOneRequest(Message (*operation)(const Message& request)) {
  signal(SIGPIPE, SIG_IGN);
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  prctl(PR_SET_DUMPABLE, 0);
  Message answer;
  try {
    answer = operation(ReceiveRequest());
    answer.fields["status"] = static_cast<uint32_t>(kSuccess);
  } catch (const Failure& failure) {
    answer.fields["status"] = failure.Code();
    answer.fields["text"] = failure.what();
  } catch (const std::exception& error) {
    answer.fields["status"] = static_cast<uint32_t>(kInternalError);
    answer.fields["text"] = error.what();
  }
  SendAnswer(answer);
  return 0;
}

}  // namespace camd
