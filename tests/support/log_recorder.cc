#include "support/log_recorder.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <mutex>
#include <ostream>
#include <utility>

#define INTERPOSED extern "C" __attribute__((visibility("default")))

// What the two become in a library that was built with fortified functions.
INTERPOSED void __vsyslog_chk(int, int, const char*, va_list) __attribute__((format(printf, 3, 0)));
INTERPOSED void __syslog_chk(int, int, const char*, ...) __attribute__((format(printf, 3, 4)));

namespace testsupport {
namespace {

constinit std::mutex recordMutex;

// Both are never destroyed: threads may still log while the process ends.
std::vector<LogLine>& Record() {
  static auto* record = new std::vector<LogLine>;
  return *record;
}

std::function<void(const LogLine&)>& Observer() {
  static auto* observer = new std::function<void(const LogLine&)>;
  return *observer;
}

__attribute__((format(printf, 2, 0))) void AddLine(int priority, const char* format, va_list arguments) {
  char* text = nullptr;
  if (vasprintf(&text, format, arguments) < 0) {
    return;
  }
  const LogLine line{priority, text};
  std::free(text);
  std::function<void(const LogLine&)> observer;
  {
    const std::lock_guard lock(recordMutex);
    Record().push_back(line);
    observer = Observer();
  }
  if (observer) {
    observer(line);
  }
}

}  // namespace

std::ostream& operator<<(std::ostream& stream, const LogLine& line) {
  return stream << '<' << line.priority << '>' << line.text;
}

std::vector<LogLine> RecordedLog() {
  const std::lock_guard lock(recordMutex);
  return Record();
}

void ForgetLog() {
  const std::lock_guard lock(recordMutex);
  Record().clear();
}

void ObserveLog(std::function<void(const LogLine&)> observer) {
  const std::lock_guard lock(recordMutex);
  Observer() = std::move(observer);
}

}  // namespace testsupport

INTERPOSED void vsyslog(int priority, const char* format, va_list arguments) {
  testsupport::AddLine(priority, format, arguments);
}

INTERPOSED void syslog(int priority, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  testsupport::AddLine(priority, format, arguments);
  va_end(arguments);
}

INTERPOSED void __vsyslog_chk(int priority, int, const char* format, va_list arguments) {
  testsupport::AddLine(priority, format, arguments);
}

INTERPOSED void __syslog_chk(int priority, int, const char* format, ...) {
  va_list arguments;
  va_start(arguments, format);
  testsupport::AddLine(priority, format, arguments);
  va_end(arguments);
}
