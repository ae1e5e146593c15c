#include "common/attempt_log.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cstdio>
#include <ctime>
#include <nlohmann/json.hpp>
#include <string_view>
#include <utility>

#include "common/paths.h"
#include "common/status.h"
#include "velmor/unique_fd.h"

namespace sambaprovider {
namespace {

constexpr off_t kLongestRecord = 1024 * 1024;

std::string Now() {
  timespec now = {};
  clock_gettime(CLOCK_REALTIME, &now);
  tm parts = {};
  gmtime_r(&now.tv_sec, &parts);
  std::array<char, 32> seconds = {};
  strftime(seconds.data(), seconds.size(), "%Y-%m-%dT%H:%M:%S", &parts);
  std::array<char, 48> text = {};
  snprintf(text.data(), text.size(), "%s.%03ldZ", seconds.data(), now.tv_nsec / 1000000);
  return text.data();
}

}  // namespace

std::string FormatAttemptLine(const std::string& time, pid_t process, const std::string& operation,
                              const std::string& step, const std::string& event, uint32_t status,
                              const std::string& text) {
  nlohmann::ordered_json line;
  line["time"] = time;
  line["process"] = process;
  line["operation"] = operation;
  line["step"] = step;
  line["event"] = event;
  line["status"] = status;
  line["text"] = text;
  return line.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

AttemptLog::AttemptLog(pid_t process, std::string operation)
    : process_(process), operation_(std::move(operation)) {}

void AttemptLog::Rotate() {
  struct stat record = {};
  if (stat(paths::kAttempts, &record) != 0 || record.st_size < kLongestRecord) return;
  rename(paths::kAttempts, (std::string(paths::kAttempts) + ".1").c_str());
}

void AttemptLog::Begin(const std::string& step, const std::string& text) const {
  Append("begin", step, 0, text);
}

void AttemptLog::End(const std::string& step, uint32_t status, const std::string& text) const {
  Append("end", step, status, text);
}

void AttemptLog::Note(const std::string& step, const std::string& text) const {
  Append("note", step, 0, text);
}

void AttemptLog::Run(const std::string& step, const std::string& text,
                     const std::function<std::string()>& body) const {
  Begin(step, text);
  try {
    End(step, kSuccess, body());
  } catch (const Failure& failure) {
    End(step, failure.Code(), failure.what());
    throw;
  }
}

void AttemptLog::Append(const char* event, const std::string& step, uint32_t status,
                        const std::string& text) const {
  try {
    const std::string line = FormatAttemptLine(Now(), process_, operation_, step, event, status, text);
    const velmor::UniqueFd record(
        open(paths::kAttempts, O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    if (!record.IsOpen() || write(record.Get(), line.data(), line.size()) < 0) return;
  } catch (const std::exception&) {
    return;
  }
}

}  // namespace sambaprovider
