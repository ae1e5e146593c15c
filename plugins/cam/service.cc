#include "service.h"

#include <arpa/inet.h>

#include <algorithm>
#include <string_view>
#include <thread>

#include "failure.h"
#include "json_memory.h"

namespace camproxy {

namespace {

constexpr unsigned int HTTP_OK = 200;
constexpr unsigned int HTTP_CREATED = 201;
constexpr unsigned int HTTP_SERVICE_UNAVAILABLE = 503;
/// When the service is busy and does not say for how long.
constexpr std::chrono::seconds DEFAULT_PAUSE{1};
constexpr std::size_t LONGEST_LOGGED_TEXT = 200;

bool IsVisible(char character) {
  return character > ' ' && character < 127;
}

[[noreturn]] void ThrowInvalidAnswer(const std::string& fault) {
  throw Failure(INVALID_DATA, "its answer " + fault);
}

/// The body of an answer, parsed where it lies: its strings point into `body`, so that nothing of it is
/// copied into memory that nobody wipes. Null when the body is not JSON.
JsonDocument ParseInPlace(SecretString& body) {
  JsonDocument json;
  json.ParseInsitu<rapidjson::kParseIterativeFlag | rapidjson::kParseValidateEncodingFlag>(body.data());
  if (json.HasParseError()) json.SetNull();
  return json;
}

std::optional<std::string_view> FindText(const JsonDocument::ValueType& object, const char* name) {
  const auto field = object.FindMember(name);
  if (field == object.MemberEnd() || !field->value.IsString()) return std::nullopt;
  return std::string_view(field->value.GetString(), field->value.GetStringLength());
}

/// A field of an answer that goes on into files and directory requests: visible ASCII and no blank.
SecretString ReadText(const JsonDocument& answer, const char* name) {
  if (!answer.IsObject()) ThrowInvalidAnswer("is no JSON object");
  const auto text = FindText(answer, name);
  if (!text) ThrowInvalidAnswer(std::string("has no text '") + name + "'");
  if (text->empty() || !std::all_of(text->begin(), text->end(), IsVisible)) {
    ThrowInvalidAnswer(std::string("has an impossible '") + name + "'");
  }
  return SecretString(*text);
}

/// What the service says to a person, fit for one line of a log.
std::string ForLog(const JsonDocument& failure) {
  const auto text = FindText(failure, "text");
  if (!text) return "no reason given";
  std::string line(text->substr(0, LONGEST_LOGGED_TEXT));
  std::replace_if(
      line.begin(), line.end(), [](char character) { return character != ' ' && !IsVisible(character); },
      '?');
  return line;
}

[[noreturn]] void ThrowRefusal(Answer& answer) {
  const std::string httpStatus = "HTTP status " + std::to_string(answer.httpStatus);
  const auto failure = ParseInPlace(answer.body);
  if (!failure.IsObject()) ThrowInvalidAnswer("is no JSON object (" + httpStatus + ")");
  const auto status = failure.FindMember("status");
  if (status == failure.MemberEnd() || !status->value.IsUint() || status->value.GetUint() == SUCCESS) {
    ThrowInvalidAnswer("has no 'status' of a failure (" + httpStatus + ")");
  }
  const std::string number = std::to_string(status->value.GetUint());
  throw Failure(status->value.GetUint(),
                "it refused with status " + number + " (" + httpStatus + "): " + ForLog(failure));
}

void WriteField(JsonWriter& writer, const char* name, const char* value) {
  writer.Key(name);
  if (!writer.String(value)) throw Failure(INVALID_PARAMETER, std::string("the '") + name + "' is not UTF-8");
}

SecretString DescribeComputer(const char* hostName, const char* container) {
  JsonText text;
  JsonWriter writer(text);
  writer.StartObject();
  WriteField(writer, "hostName", hostName);
  if (container != nullptr) WriteField(writer, "container", container);
  writer.EndObject();
  return {text.GetString(), text.GetSize()};
}

}  // namespace

Service::Service(const std::string& server, bool verifyCertificate, const std::string& thumbprint)
    : server_(server), settings_(LoadSettings()) {
  in_addr address{};
  if (inet_pton(AF_INET, server.c_str(), &address) != 1) {
    throw Failure(INVALID_PARAMETER, "not an IPv4 address");
  }
  if (verifyCertificate) check_.emplace(server, thumbprint, settings_.Sha256For(server));
}

Answer Service::Ask(const Request& request, unsigned int successStatus) {
  const auto deadline = Clock::now() + settings_.requestTimeout;
  while (true) {
    const Target target{server_, settings_.port, Clock::now() + settings_.connectTimeout, deadline};
    Answer answer = Exchange(target, check_ ? &*check_ : nullptr, request);
    if (answer.httpStatus == successStatus) return answer;
    if (answer.httpStatus != HTTP_SERVICE_UNAVAILABLE) ThrowRefusal(answer);
    const auto pause = std::max(answer.retryAfter.value_or(DEFAULT_PAUSE), DEFAULT_PAUSE);
    if (Clock::now() + pause >= deadline) throw Failure(TIMED_OUT, "it is busy");
    std::this_thread::sleep_for(pause);
  }
}

DomainInfo Service::GetDomain() {
  // Deliberate: without the token, which is for one creation and is not shown to a server that nobody
  // verified.
  Answer answer = Ask({"/v1/domain", {}, {}}, HTTP_OK);
  const auto domain = ParseInPlace(answer.body);
  return {ReadText(domain, "netbiosDomainName"), ReadText(domain, "dnsDomainName"),
          ReadText(domain, "domainSid")};
}

MachineAccount Service::CreateComputer(const char* hostName, const char* container) {
  Answer answer =
      Ask({"/v1/computers", DescribeComputer(hostName, container), settings_.token}, HTTP_CREATED);
  const auto account = ParseInPlace(answer.body);
  return {ReadText(account, "accountName"), ReadText(account, "joinBlob")};
}

}  // namespace camproxy
