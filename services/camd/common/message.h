// What the service, its helper and the helper's provisioning program say to each other. A message is one line
// of JSON, an object whose "secretSize" tells how many bytes of a secret follow the line. A request has
// "operation"; an answer has "status" and "text". docs of each operation: helper/helper_main.cc.
#ifndef CAMD_COMMON_MESSAGE_H
#define CAMD_COMMON_MESSAGE_H

#include <chrono>
#include <nlohmann/json.hpp>
#include <string>

#include "common/secret.h"

namespace camd {

struct Message {
  nlohmann::json fields = nlohmann::json::object();
  Secret secret;

  // A field's text; empty when it is absent or no text.
  std::string Text(const char* field) const;
  // A field's number; 0 when it is absent or no whole number.
  int64_t Number(const char* field) const;
};

// Starts `program`, sends it the request and waits for its answer. Throws Failure: what the answer's "status"
// says when that is not 0, kTimeout when there is no answer within `limit` (the program is killed then),
// kHelperDied when it ended without one.
Message Ask(const std::string& program, const Message& request, std::chrono::milliseconds limit);

// In the started program: reads the request from standard input. Throws Failure (kInvalidParameter).
Message ReceiveRequest();

// In the started program: writes an answer to standard output. A caller that has gone is no failure.
void SendAnswer(const Message& answer);

// In the started program: answers one request with what `operation` returns, or with the status of the
// failure that it throws; has the program killed when its caller ends; keeps secrets out of core files.
// Returns the exit status.
int ServeOneRequest(Message (*operation)(const Message& request));

}  // namespace camd

#endif  // CAMD_COMMON_MESSAGE_H
