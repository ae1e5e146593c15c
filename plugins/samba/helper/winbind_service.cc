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
#include "common/names.h"
#include "common/status.h"
#include "velmor/unique_fd.h"

namespace sambaprovider::winbind_service {
namespace {

constexpr const char* kProgram = "/usr/sbin/winbindd";
constexpr const char* kProcessFile = "/run/samba/winbindd.pid";
constexpr const char* kUnit = "winbind.service";
constexpr std::chrono::seconds kStartTime{15};
constexpr std::chrono::seconds kFriendlyStopTime{5};
constexpr std::chrono::seconds kStopTime{15};
constexpr std::chrono::milliseconds kPause{20};

bool SystemdRuns() {
  return FileExists("/run/systemd/system");
}

void SystemCtl(const std::vector<std::string>& verb, std::chrono::milliseconds limit) {
  std::vector<std::string> command = {"/usr/bin/systemctl", "--no-ask-password", kUnit};
  command.insert(command.end() - 1, verb.begin(), verb.end());
  const ProgramResult result = RunProgram(command, ProgramOutput::kWanted, limit);
  if (result.exitStatus == 0) return;
  throw Failure(kServiceNotActive, std::string("systemctl ") + verb.front() + " " + kUnit +
                                       " failed: " + LastLine(result.output));
}

struct Process {
  pid_t number = -1;
  velmor::UniqueFd handle;
};

// The running winbindd; the handle is closed when none runs.
Process RunningProcess() {
  const std::string text = ReadFile(kProcessFile).value_or("");
  Process process;
  std::from_chars(text.data(), text.data() + text.size(), process.number);
  if (process.number <= 0) return {};
  process.handle = velmor::UniqueFd(pidfd_open(process.number, 0));
  // The file may be left over from a process whose number now belongs to another.
  const std::string name = ReadFile("/proc/" + std::to_string(process.number) + "/comm").value_or("");
  if (name.rfind("winbindd", 0) != 0) return {};
  return process;
}

void NetCache(const std::vector<std::string>& arguments) {
  std::vector<std::string> command = {"/usr/bin/net", "cache"};
  command.insert(command.end(), arguments.begin(), arguments.end());
  const ProgramResult result = RunProgram(command, ProgramOutput::kWanted, kStopTime);
  if (result.exitStatus != 0)
    throw Failure(kInternalError, "net cache " + arguments.front() + " failed: " + LastLine(result.output));
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

bool EndsWithin(const velmor::UniqueFd& process, std::chrono::milliseconds limit) {
  pollfd entry = {process.Get(), POLLIN, 0};
  return poll(&entry, 1, static_cast<int>(limit.count())) == 1;
}

// While a controller does not answer, winbindd does not react to a friendly signal for a long time.
void StopDirectly() {
  const auto [number, process] = RunningProcess();
  if (!process.IsOpen()) return;
  pidfd_send_signal(process.Get(), SIGTERM, nullptr, 0);
  if (EndsWithin(process, kFriendlyStopTime)) return;
  // Its children wait in the same way; as a daemon it leads their process group.
  if (getpgid(number) == number) kill(-number, SIGKILL);
  pidfd_send_signal(process.Get(), SIGKILL, nullptr, 0);
  if (!EndsWithin(process, kStopTime)) throw Failure(kServiceNotActive, "winbindd does not end");
}

void StopThroughSystemd() {
  try {
    SystemCtl({"stop"}, kFriendlyStopTime);
  } catch (const Failure&) {
    SystemCtl({"kill", "--signal=SIGKILL"}, kStopTime);
    SystemCtl({"stop"}, kStopTime);
  }
}

}  // namespace

void RequireInstalled() {
  if (access(kProgram, X_OK) != 0)
    throw Failure(kServiceNotInstalled, std::string(kProgram) + " is not installed");
}

bool IsRunning() {
  if (!SystemdRuns()) return RunningProcess().handle.IsOpen();
  return RunProgram({"/usr/bin/systemctl", "--quiet", "is-active", kUnit}, ProgramOutput::kDropped,
                    kStartTime)
             .exitStatus == 0;
}

void Start() {
  if (SystemdRuns()) {
    // Several joins and leaves in a row are no reason to refuse the next start. Fails for a unit that has not
    // been loaded yet, which has no starts to forget either.
    RunProgram({"/usr/bin/systemctl", "--quiet", "reset-failed", kUnit}, ProgramOutput::kDropped, kStartTime);
    SystemCtl({"start"}, kStartTime);
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
    StopThroughSystemd();
  } else {
    StopDirectly();
  }
}

void FlushCache() {
  NetCache({"flush"});
}

void BeginWith(const std::string& controller, const std::vector<std::string>& domainNames) {
  for (const std::string& name : domainNames) {
    // Where Samba keeps the controller at which a host was joined. It comes before all others until it fails.
    NetCache({"add", "SAFJOIN/DOMAIN/" + UpperCase(name), controller, "52w"});
  }
}

}  // namespace sambaprovider::winbind_service
