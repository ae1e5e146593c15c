#include "helper/winbind_service.h"

#include <poll.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

extern "C" {  // which these headers lack
#include <stdint.h>
#include <sys/pidfd.h>
#include <wbclient.h>
}

#include <cerrno>
#include <charconv>
#include <chrono>
#include <memory>
#include <string>
#include <thread>

#include "common/child.h"
#include "common/files.h"
#include "common/status.h"
#include "common/unique_fd.h"

namespace sambaprovider::winbind_service {
namespace {

constexpr const char* kProgram = "/usr/sbin/winbindd";
constexpr const char* kProcessFile = "/run/samba/winbindd.pid";
constexpr const char* kUnit = "winbind.service";
constexpr std::chrono::seconds kStartTime{15};
constexpr std::chrono::seconds kStopTime{15};
constexpr std::chrono::milliseconds kPause{20};

bool SystemdRuns() {
  return FileExists("/run/systemd/system");
}

void SystemCtl(const char* verb, std::chrono::milliseconds limit) {
  const ProgramResult result =
      RunProgram({"/usr/bin/systemctl", "--no-ask-password", verb, kUnit}, ProgramOutput::kWanted, limit);
  if (result.exitStatus == 0) return;
  throw Failure(kServiceNotActive,
                std::string("systemctl ") + verb + " " + kUnit + " failed: " + LastLine(result.output));
}

// The running winbindd; nothing when none runs.
UniqueFd RunningProcess() {
  const std::string text = ReadFile(kProcessFile).value_or("");
  pid_t process = 0;
  std::from_chars(text.data(), text.data() + text.size(), process);
  if (process <= 0) return {};
  UniqueFd handle(pidfd_open(process, 0));
  // The file may be left over from a process whose number now belongs to another.
  const std::string name = ReadFile("/proc/" + std::to_string(process) + "/comm").value_or("");
  return name.rfind("winbindd", 0) == 0 ? std::move(handle) : UniqueFd();
}

bool Answers() {
  wbcContext* raw = wbcCtxCreate();
  if (raw == nullptr) return false;
  const std::unique_ptr<wbcContext, void (*)(wbcContext*)> context(raw, wbcCtxFree);
  return WBC_ERROR_IS_OK(wbcCtxPing(context.get()));
}

// winbindd refuses to run when others could enter this folder.
void PrepareFolders() {
  MakeFolder("/run/samba", 0755);
  MakeFolder("/var/lib/samba/private", 0700);
  MakeFolder("/var/lib/samba/winbindd_privileged", 0750);
  chmod("/var/lib/samba/winbindd_privileged", 0750);
}

void StartDirectly() {
  PrepareFolders();
  const ProgramResult result = RunProgram({kProgram, "-D"}, ProgramOutput::kDropped, kStartTime);
  if (result.exitStatus != 0)
    throw Failure(kServiceNotActive, "winbindd does not start; see /var/log/samba/log.winbindd");
}

void StopDirectly() {
  const UniqueFd process = RunningProcess();
  if (!process.IsOpen()) return;
  pidfd_send_signal(process.Get(), SIGTERM, nullptr, 0);
  pollfd entry = {process.Get(), POLLIN, 0};
  if (poll(&entry, 1, static_cast<int>(std::chrono::milliseconds(kStopTime).count())) == 1) return;
  throw Failure(kServiceNotActive, "winbindd does not end");
}

}  // namespace

void RequireInstalled() {
  if (access(kProgram, X_OK) != 0)
    throw Failure(kServiceNotInstalled, std::string(kProgram) + " is not installed");
}

bool IsRunning() {
  if (!SystemdRuns()) return RunningProcess().IsOpen();
  return RunProgram({"/usr/bin/systemctl", "--quiet", "is-active", kUnit}, ProgramOutput::kDropped,
                    kStartTime)
             .exitStatus == 0;
}

void Start() {
  if (SystemdRuns()) {
    SystemCtl("start", kStartTime);
  } else {
    StartDirectly();
  }
  const auto deadline = std::chrono::steady_clock::now() + kStartTime;
  while (!Answers()) {
    if (std::chrono::steady_clock::now() >= deadline) {
      throw Failure(kServiceNotActive, "winbindd does not answer; see /var/log/samba/log.winbindd");
    }
    std::this_thread::sleep_for(kPause);
  }
}

void Stop() {
  if (SystemdRuns()) {
    SystemCtl("stop", kStopTime);
  } else {
    StopDirectly();
  }
}

void FlushCache() {
  const ProgramResult result =
      RunProgram({"/usr/bin/net", "cache", "flush"}, ProgramOutput::kWanted, kStopTime);
  if (result.exitStatus != 0)
    throw Failure(kInternalError, "net cache flush failed: " + LastLine(result.output));
}

}  // namespace sambaprovider::winbind_service
