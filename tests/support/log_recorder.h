/// What the process writes to the system log, recorded instead of written.
#ifndef SUPPORT_LOG_RECORDER_H
#define SUPPORT_LOG_RECORDER_H

#include <syslog.h>

#include <functional>
#include <iosfwd>
#include <string>
#include <vector>

namespace testsupport {

struct LogLine {
  int priority;
  std::string text;

  bool operator==(const LogLine&) const = default;
};

/// For the messages of a failed comparison.
std::ostream& operator<<(std::ostream& stream, const LogLine& line);

/// Every line of the process so far, in order, of all threads. Nothing ever reaches the machine's log.
std::vector<LogLine> RecordedLog();

/// Forgets the lines so far.
void ForgetLog();

/// Calls `observer` with each later line, on the thread that writes it; an empty one ends that.
void ObserveLog(std::function<void(const LogLine&)> observer);

}  // namespace testsupport

#endif  // SUPPORT_LOG_RECORDER_H
