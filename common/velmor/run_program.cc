#include "velmor/run_program.h"

#include <fcntl.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <optional>
#include <thread>

namespace velmor {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::chrono::milliseconds kPollInterval(5);

/// What the program begins with.
class SpawnSettings {
 public:
  explicit SpawnSettings(const std::string& output) {
    posix_spawn_file_actions_init(&actions_);
    posix_spawn_file_actions_addopen(&actions_, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
    posix_spawn_file_actions_addopen(&actions_, STDOUT_FILENO, output.c_str(), O_WRONLY | O_CREAT | O_TRUNC,
                                     0600);
    posix_spawn_file_actions_adddup2(&actions_, STDOUT_FILENO, STDERR_FILENO);
    posix_spawn_file_actions_addclosefrom_np(&actions_, STDERR_FILENO + 1);
    posix_spawnattr_init(&attributes_);
    sigset_t signals;
    sigemptyset(&signals);
    posix_spawnattr_setsigmask(&attributes_, &signals);
    sigfillset(&signals);
    posix_spawnattr_setsigdefault(&attributes_, &signals);
    posix_spawnattr_setpgroup(&attributes_, 0);
    posix_spawnattr_setflags(&attributes_,
                             POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETPGROUP);
  }
  SpawnSettings(const SpawnSettings&) = delete;
  SpawnSettings& operator=(const SpawnSettings&) = delete;
  ~SpawnSettings() {
    posix_spawn_file_actions_destroy(&actions_);
    posix_spawnattr_destroy(&attributes_);
  }

  const posix_spawn_file_actions_t* Actions() const { return &actions_; }
  const posix_spawnattr_t* Attributes() const { return &attributes_; }

 private:
  posix_spawn_file_actions_t actions_{};
  posix_spawnattr_t attributes_{};
};

std::vector<char*> Pointers(const std::vector<std::string>& texts) {
  std::vector<char*> pointers;
  pointers.reserve(texts.size() + 1);
  for (const std::string& text : texts) pointers.push_back(const_cast<char*>(text.c_str()));
  pointers.push_back(nullptr);
  return pointers;
}

std::string Failure(int status) {
  if (WIFSIGNALED(status)) return "it was ended by signal " + std::to_string(WTERMSIG(status));
  return WEXITSTATUS(status) == 0 ? "" : "it ended with status " + std::to_string(WEXITSTATUS(status));
}

/// How the program ended, or nothing while it runs.
std::optional<std::string> FailureOnceEnded(pid_t process) {
  int status = 0;
  const pid_t ended = waitpid(process, &status, WNOHANG);
  if (ended == process) return Failure(status);
  // Somebody else took the status away.
  if (ended < 0 && errno == ECHILD) return "";
  return std::nullopt;
}

std::optional<std::string> FailureUntil(Clock::time_point deadline, pid_t process) {
  for (;;) {
    if (auto failure = FailureOnceEnded(process)) return failure;
    if (Clock::now() >= deadline) return std::nullopt;
    std::this_thread::sleep_for(kPollInterval);
  }
}

void Kill(pid_t process) {
  kill(-process, SIGKILL);
  while (waitpid(process, nullptr, 0) < 0 && errno == EINTR) {
  }
}

}  // namespace

ProgramEnd RunProgram(const Program& program) {
  const SpawnSettings settings(program.output);
  const auto deadline = Clock::now() + program.longestRun;
  pid_t child = 0;
  const int error =
      posix_spawn(&child, program.arguments.front().c_str(), settings.Actions(), settings.Attributes(),
                  Pointers(program.arguments).data(), Pointers(program.environment).data());
  if (error != 0) return {error, ""};
  if (const auto failure = FailureUntil(deadline, child)) return {0, *failure};
  Kill(child);
  return {0, "it did not end within " + std::to_string(program.longestRun.count()) + " seconds"};
}

}  // namespace velmor
