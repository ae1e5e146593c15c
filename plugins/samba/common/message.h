/// What the plug-in, the helper and the pre-check say to each other: a request is one line of JSON followed
/// by the bytes of one secret, an answer is one line of JSON with at least "status" and "text".
#ifndef SAMBA_COMMON_MESSAGE_H
#define SAMBA_COMMON_MESSAGE_H

#include <chrono>
#include <nlohmann/json.hpp>
#include <string>

#include "common/child.h"
#include "velmor/secret.h"

namespace sambaprovider {

struct Request {
  nlohmann::json fields;
  velmor::Secret secret;

  /// A field's text; empty when it is absent. Throws Failure (kInvalidParameter) when it is no text.
  std::string Text(const char* field) const;
};

/// What became of a request that was sent.
struct Answer {
  Conversation::End end = Conversation::End::kDied;
  /// Meaningful when answered; an answer that cannot be read counts as a death of its sender.
  nlohmann::json fields;
};

/// Starts `program`, sends it the request and waits for its answer; see Converse. Throws Failure
/// (kInvalidParameter) for a request with bytes that are not UTF-8.
Answer Ask(const std::string& program, ChildGroup group, ChildEnvironment environment, const Request& request,
           std::chrono::milliseconds limit);

/// In the child: reads the request from standard input. Throws Failure (kInvalidParameter).
Request ReceiveRequest();

/// In the child: writes the answer to standard output. A caller that has gone is no failure.
void SendAnswer(const nlohmann::json& fields);

/// In the child: whether the process that asked has ended.
bool CallerHasGone();

}  // namespace sambaprovider

#endif  // SAMBA_COMMON_MESSAGE_H
