#include "service/audit_log.h"

#include <fcntl.h>
#include <syslog.h>

#include <array>
#include <cerrno>
#include <ctime>

#include "common/status.h"
#include "service/configuration.h"

namespace camd {
namespace {

std::string TimeText() {
  const time_t now = time(nullptr);
  tm parts = {};
  gmtime_r(&now, &parts);
  std::array<char, 32> text = {};
  strftime(text.data(), text.size(), "%Y-%m-%dT%H:%M:%SZ", &parts);
  return text.data();
}

}  // namespace

void AuditLog::Open(const std::string& file) {
  UniqueFd opened;
  if (!file.empty()) {
    opened = UniqueFd(open(file.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC | O_NOFOLLOW, 0600));
    if (!opened.IsOpen())
      throw ConfigurationError("cannot open the audit file " + file + ": " + ErrorText(errno));
  }
  const std::lock_guard lock(mutex_);
  file_ = std::move(opened);
}

void AuditLog::Write(nlohmann::json event) {
  event["time"] = TimeText();
  const std::string line = event.dump(-1, ' ', true, nlohmann::json::error_handler_t::replace);
  const std::lock_guard lock(mutex_);
  if (!file_.IsOpen()) {
    syslog(LOG_AUTHPRIV | LOG_INFO, "%s", line.c_str());
    return;
  }
  const std::string whole = line + "\n";
  if (write(file_.Get(), whole.data(), whole.size()) != static_cast<ssize_t>(whole.size())) {
    syslog(LOG_ERR, "the audit file cannot be written: %s", ErrorText(errno).c_str());
    syslog(LOG_AUTHPRIV | LOG_INFO, "%s", line.c_str());
  }
}

}  // namespace camd
