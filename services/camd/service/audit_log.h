// Who asked for what, and what came of it.
#ifndef CAMD_SERVICE_AUDIT_LOG_H
#define CAMD_SERVICE_AUDIT_LOG_H

#include <mutex>
#include <nlohmann/json.hpp>
#include <string>

#include "common/unique_fd.h"

namespace camd {

// Writes each event as one line of JSON, to a file or, without one, to the system log with the facility
// "authpriv". Safe for use by several threads.
class AuditLog {
 public:
  // Opens `file`, made with mode 0600, or turns to the system log when that is empty. Opened once more at
  // each call, so that a file that was moved away gets a successor. Throws ConfigurationError; what was open
  // stays.
  void Open(const std::string& file);

  // Adds the time to the event and writes it. A line that cannot be written is reported to the system log.
  void Write(nlohmann::json event);

 private:
  std::mutex mutex_;
  UniqueFd file_;
};

}  // namespace camd

#endif  // CAMD_SERVICE_AUDIT_LOG_H
