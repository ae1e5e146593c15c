#include "system/run_program.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>

#include <cerrno>
#include <chrono>
#include <thread>

#include "system/system_error.h"

namespace HostMgmt::System {
namespace {

constexpr std::chrono::seconds kLongestRun(30);
constexpr std::chrono::milliseconds kPollInterval(5);

/// What the child process begins with: no signal blocked or ignored, and nothing open but /dev/null.
class SpawnSettings {
 public:
  SpawnSettings() {
    posix_spawn_file_actions_init(&actions_);
    posix_spawn_file_actions_addopen(&actions_, 0, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions_, 1, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addopen(&actions_, 2, "/dev/null", O_WRONLY, 0);
    posix_spawn_file_actions_addclosefrom_np(&actions_, 3);
    sigset_t signals;
    posix_spawnattr_init(&attributes_);
    sigemptyset(&signals);
    posix_spawnattr_setsigmask(&attributes_, &signals);
    sigfillset(&signals);
    posix_spawnattr_setsigdefault(&attributes_, &signals);
    posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
  }
  ~SpawnSettings() {
    posix_spawn_file_actions_destroy(&actions_);
    posix_spawnattr_destroy(&attributes_);
  }
  SpawnSettings(const SpawnSettings&) = delete;
  SpawnSettings& operator=(const SpawnSettings&) = delete;

  const posix_spawn_file_actions_t* Actions() const { return &actions_; }
  const posix_spawnattr_t* Attributes() const { return &attributes_; }

 private:
  posix_spawn_file_actions_t actions_{};
  posix_spawnattr_t attributes_{};
};

[[noreturn]] void ThrowRunError(const std::string& program, const std::string& reason) {
  ThrowFileError("run", program, reason);
}

pid_t Start(std::vector<std::string> arguments) {
  std::vector<char*> pointers;
  pointers.reserve(arguments.size() + 1);
  for (std::string& argument : arguments) pointers.push_back(argument.data());
  pointers.push_back(nullptr);
  std::string path = "PATH=/usr/sbin:/usr/bin:/sbin:/bin";
  std::string locale = "LC_ALL=C";
  char* const environment[] = {path.data(), locale.data(), nullptr};
  const SpawnSettings settings;
  pid_t child = 0;
  const int error = posix_spawn(&child, pointers[0], settings.Actions(), settings.Attributes(),
                                pointers.data(), environment);
  if (error != 0) ThrowRunError(arguments[0], ErrorText(error));
  return child;
}

void CheckStatus(const std::string& program, int status) {
  if (WIFSIGNALED(status)) {
    ThrowRunError(program, "it was ended by signal " + std::to_string(WTERMSIG(status)));
  }
  if (WEXITSTATUS(status) != 0) {
    ThrowRunError(program, "it ended with status " + std::to_string(WEXITSTATUS(status)));
  }
}

}  // namespace

void RunProgram(const std::vector<std::string>& arguments) {
  const std::string& program = arguments.front();
  const pid_t child = Start(arguments);
  const auto deadline = std::chrono::steady_clock::now() + kLongestRun;
  for (;;) {
    int status = 0;
    const pid_t ended = waitpid(child, &status, WNOHANG);
    if (ended == child) return CheckStatus(program, status);
    // A process that ignores SIGCHLD, or that collects every child itself, takes the status away from here:
    // the program has ended, and how is not known.
    if (ended < 0 && errno == ECHILD) return;
    if (std::chrono::steady_clock::now() >= deadline) {
      kill(child, SIGKILL);
      waitpid(child, &status, 0);
      ThrowRunError(program, "it did not end within thirty seconds");
    }
    std::this_thread::sleep_for(kPollInterval);
  }
}

}  // namespace HostMgmt::System
