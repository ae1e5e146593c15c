#include "pam_edit/run_program.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>

#include "text.h"

namespace velmorctl::pam {

namespace {

constexpr int longestRunMilliseconds = 60000;

/// What the program begins with: a process group of its own, so that its children can be ended too, no
/// signal blocked or ignored, and no descriptor but the three standard ones.
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
  for (const std::string& text : texts) {
    pointers.push_back(const_cast<char*>(text.c_str()));
  }
  pointers.push_back(nullptr);
  return pointers;
}

/// Whether the process ends in time.
bool EndsInTime(pid_t process) {
  int descriptor = static_cast<int>(syscall(SYS_pidfd_open, process, 0));
  if (descriptor < 0) {
    return false;
  }
  pollfd wait = {descriptor, POLLIN, 0};
  int ready = 0;
  do {
    ready = poll(&wait, 1, longestRunMilliseconds);
  } while (ready < 0 && errno == EINTR);
  close(descriptor);
  return ready > 0;
}

std::string Ending(int status) {
  if (WIFSIGNALED(status)) {
    return "it was ended by signal " + std::to_string(WTERMSIG(status));
  }
  return WEXITSTATUS(status) == 0 ? "" : "it ended with status " + std::to_string(WEXITSTATUS(status));
}

}  // namespace

ProgramRun RunProgram(const std::vector<std::string>& arguments, const std::vector<std::string>& environment,
                      const std::string& output) {
  const SpawnSettings settings(output);
  pid_t child = 0;
  int error = posix_spawn(&child, arguments.front().c_str(), settings.Actions(), settings.Attributes(),
                          Pointers(arguments).data(), Pointers(environment).data());
  if (error != 0) {
    return {false, SystemErrorText(error)};
  }
  bool inTime = EndsInTime(child);
  if (!inTime) {
    kill(-child, SIGKILL);
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  return {true, inTime ? Ending(status) : "it did not end within a minute"};
}

}  // namespace velmorctl::pam
