#include "service/system_manager.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <syslog.h>

#include <algorithm>
#include <cerrno>
#include <cstddef>
#include <cstdlib>
#include <string_view>

#include "common/status.h"
#include "common/unique_fd.h"

namespace camd {
namespace {

bool Send(std::string_view place, std::string_view text) {
  sockaddr_un address = {};
  address.sun_family = AF_UNIX;
  if (place.size() >= sizeof address.sun_path) {
    errno = ENAMETOOLONG;
    return false;
  }
  std::copy(place.begin(), place.end(), address.sun_path);
  // A name that is no file's begins with a zero byte, which is written as "@".
  if (place.starts_with('@')) address.sun_path[0] = '\0';
  const auto size = static_cast<socklen_t>(offsetof(sockaddr_un, sun_path) + place.size());
  const UniqueFd socket(::socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0));
  return socket.IsOpen() && sendto(socket.Get(), text.data(), text.size(), MSG_NOSIGNAL,
                                   reinterpret_cast<const sockaddr*>(&address), size) >= 0;
}

void Tell(std::string_view text) {
  const char* place = std::getenv("NOTIFY_SOCKET");
  if (place == nullptr || *place == '\0') return;
  if (!Send(place, text)) {
    syslog(LOG_WARNING, "the system manager cannot be told of the service's state: %s",
           ErrorText(errno).c_str());
  }
}

}  // namespace

void TellReady() {
  Tell("READY=1");
}

void TellStopping() {
  Tell("STOPPING=1");
}

}  // namespace camd
