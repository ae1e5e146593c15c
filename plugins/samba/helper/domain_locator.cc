#include "helper/domain_locator.h"

#include <ares.h>
#include <arpa/nameser.h>
#include <sys/select.h>

#include <algorithm>
#include <memory>

#include "common/names.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

constexpr int kTimeoutMilliseconds = 2000;
constexpr int kTries = 2;

struct Reply {
  int status = ARES_ETIMEOUT;
  std::vector<std::string> controllers;
};

struct ChannelRelease {
  void operator()(ares_channeldata* channel) const { ares_destroy(channel); }
};
using Channel = std::unique_ptr<ares_channeldata, ChannelRelease>;

struct DataRelease {
  void operator()(void* data) const { ares_free_data(data); }
};

void TakeReply(void* target, int status, int /*timeouts*/, unsigned char* bytes, int length) {
  auto* reply = static_cast<Reply*>(target);
  reply->status = status;
  if (status != ARES_SUCCESS) return;
  ares_srv_reply* first = nullptr;
  reply->status = ares_parse_srv_reply(bytes, length, &first);
  const std::unique_ptr<ares_srv_reply, DataRelease> records(first);
  std::vector<const ares_srv_reply*> ordered;
  for (const ares_srv_reply* record = first; record != nullptr; record = record->next)
    ordered.push_back(record);
  std::stable_sort(ordered.begin(), ordered.end(),
                   [](const ares_srv_reply* left, const ares_srv_reply* right) {
                     return left->priority != right->priority ? left->priority < right->priority
                                                              : left->weight > right->weight;
                   });
  for (const ares_srv_reply* record : ordered) reply->controllers.emplace_back(record->host);
}

// Runs the channel until its query has ended; the library's own time-outs end it.
void Finish(ares_channel channel) {
  for (;;) {
    fd_set readable;
    fd_set writable;
    FD_ZERO(&readable);
    FD_ZERO(&writable);
    const int count = ares_fds(channel, &readable, &writable);
    if (count == 0) return;
    timeval storage = {};
    timeval* limit = ares_timeout(channel, nullptr, &storage);
    select(count, &readable, &writable, nullptr, limit);
    ares_process(channel, &readable, &writable);
  }
}

Reply Query(const std::string& name, int flags) {
  ares_options options = {};
  options.flags = flags;
  options.timeout = kTimeoutMilliseconds;
  options.tries = kTries;
  ares_channel raw = nullptr;
  if (ares_init_options(&raw, &options, ARES_OPT_FLAGS | ARES_OPT_TIMEOUTMS | ARES_OPT_TRIES) !=
      ARES_SUCCESS) {
    throw Failure(kInternalError, "the resolver cannot be set up");
  }
  const Channel channel(raw);
  Reply reply;
  ares_query(raw, name.c_str(), ns_c_in, ns_t_srv, TakeReply, &reply);
  Finish(raw);
  return reply;
}

bool SaysNoSuchDomain(int status) {
  return status == ARES_ENOTFOUND || status == ARES_ENODATA || status == ARES_EREFUSED;
}

}  // namespace

std::vector<std::string> LocateControllers(const std::string& dnsDomain) {
  const std::string name = "_ldap._tcp.dc._msdcs." + dnsDomain;
  Reply reply = Query(name, 0);
  if (reply.status == ARES_SUCCESS && !reply.controllers.empty()) return reply.controllers;
  // By itself the resolver passes over a server that refuses and reports a time-out in the end.
  if (!SaysNoSuchDomain(reply.status)) reply = Query(name, ARES_FLAG_NOCHECKRESP);
  const std::string reason = name + ": " + ares_strerror(reply.status);
  if (reply.status == ARES_SUCCESS || SaysNoSuchDomain(reply.status)) {
    throw Failure(kNoSuchDomain, "DNS names no controller of " + dnsDomain + " (" + reason + ")");
  }
  throw Failure(kNoLogonServers, "the name servers do not answer for " + dnsDomain + " (" + reason + ")");
}

std::vector<std::string> ControllersInTurn(const std::vector<std::string>& preferred,
                                           const std::vector<std::string>& located) {
  constexpr size_t kMostPreferred = 2;
  std::vector<std::string> turn = preferred;
  turn.resize(std::min(turn.size(), kMostPreferred));
  for (const std::string& controller : located) {
    const bool known = std::any_of(turn.begin(), turn.end(), [&controller](const std::string& other) {
      return EqualWithoutCase(controller, other);
    });
    if (!known) turn.push_back(controller);
  }
  return turn;
}

std::vector<std::string> ControllersToTry(const AttemptLog& log, const std::string& dnsDomain,
                                          const std::vector<std::string>& preferred) {
  std::vector<std::string> located;
  log.Run("locate", "asking DNS for the controllers of " + dnsDomain, [&] {
    located = LocateControllers(dnsDomain);
    return std::to_string(located.size()) + " known, the first is " + located.front();
  });
  return ControllersInTurn(preferred, located);
}

}  // namespace sambaprovider
