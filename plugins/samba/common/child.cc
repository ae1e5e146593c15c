#include "common/child.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

extern "C" {
#include <sys/pidfd.h>  // lacks the C linkage of its declarations
}

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>

#include "common/files.h"
#include "common/status.h"
#include "velmor/unique_fd.h"

namespace sambaprovider {
namespace {

using Clock = std::chrono::steady_clock;

constexpr size_t kLongestAnswer = 1024 * 1024;
// How long a child that has answered may take to end.
constexpr std::chrono::milliseconds kEndingTime{3000};

constexpr const char* kMinimalEnvironment[] = {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "LC_ALL=C", nullptr};

int MillisecondsUntil(Clock::time_point deadline) {
  const auto left = std::chrono::ceil<std::chrono::milliseconds>(deadline - Clock::now()).count();
  return static_cast<int>(std::clamp<decltype(left)>(left, 0, 3'600'000));
}

// Waits until the descriptor has one of the events or the deadline has come; false for the latter.
bool WaitFor(int descriptor, short events, Clock::time_point deadline) {
  pollfd entry = {descriptor, events, 0};
  for (;;) {
    const int ready = poll(&entry, 1, MillisecondsUntil(deadline));
    if (ready > 0) return true;
    if (ready == 0 && Clock::now() >= deadline) return false;
    if (ready < 0 && errno != EINTR) return false;
  }
}

// What posix_spawn needs, released at the end. Standard errors always lead nowhere.
class SpawnPlan {
 public:
  explicit SpawnPlan(ChildGroup group) {
    posix_spawn_file_actions_init(&actions_);
    posix_spawnattr_init(&attributes_);
    sigset_t none;
    sigset_t all;
    sigemptyset(&none);
    sigfillset(&all);
    posix_spawnattr_setsigmask(&attributes_, &none);
    posix_spawnattr_setsigdefault(&attributes_, &all);
    const int session = group == ChildGroup::kOwn ? POSIX_SPAWN_SETSID : 0;
    posix_spawnattr_setflags(&attributes_,
                             static_cast<short>(POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF | session));
  }
  SpawnPlan(const SpawnPlan&) = delete;
  SpawnPlan& operator=(const SpawnPlan&) = delete;
  ~SpawnPlan() {
    posix_spawn_file_actions_destroy(&actions_);
    posix_spawnattr_destroy(&attributes_);
  }

  // The three ways to connect a child's standard descriptors. The orders are such that they also work when
  // the caller has none of its own, so that `descriptor` itself is 0, 1 or 2.
  void ConnectBothWays(int descriptor) {
    posix_spawn_file_actions_adddup2(&actions_, descriptor, 0);
    posix_spawn_file_actions_adddup2(&actions_, descriptor, 1);
    ConnectNull(2);
  }
  void ConnectOutput(int descriptor) {
    posix_spawn_file_actions_adddup2(&actions_, descriptor, 1);
    posix_spawn_file_actions_adddup2(&actions_, 1, 2);
    ConnectNull(0);
  }
  void ConnectNothing() {
    ConnectNull(0);
    ConnectNull(1);
    ConnectNull(2);
  }

  pid_t Start(const std::vector<std::string>& command, ChildEnvironment environment) {
    posix_spawn_file_actions_addclosefrom_np(&actions_, 3);
    std::vector<char*> arguments;
    for (const std::string& argument : command) arguments.push_back(const_cast<char*>(argument.c_str()));
    arguments.push_back(nullptr);
    char* const* variables =
        environment == ChildEnvironment::kMinimal ? const_cast<char* const*>(kMinimalEnvironment) : environ;
    pid_t process = -1;
    const int error =
        posix_spawn(&process, arguments[0], &actions_, &attributes_, arguments.data(), variables);
    if (error != 0) throw Failure(kInternalError, "cannot start " + command[0] + ": " + ErrorText(error));
    return process;
  }

 private:
  void ConnectNull(int descriptor) {
    posix_spawn_file_actions_addopen(&actions_, descriptor, "/dev/null", O_RDWR, 0);
  }

  posix_spawn_file_actions_t actions_;
  posix_spawnattr_t attributes_;
};

// A started child; it has ended and is collected when this ends.
class Child {
 public:
  Child(SpawnPlan& plan, const std::vector<std::string>& command, ChildGroup group,
        ChildEnvironment environment)
      : process_(plan.Start(command, environment)), group_(group), handle_(pidfd_open(process_, 0)) {
    // In a host that ignores its children's ends, this one may be gone without a trace already.
    const int error = errno;
    if (handle_.IsOpen() || error == ESRCH) return;
    Kill();
    throw Failure(kInternalError, "cannot watch " + command[0] + ": " + ErrorText(error));
  }
  Child(const Child&) = delete;
  Child& operator=(const Child&) = delete;
  ~Child() {
    if (!collected_) Kill();
  }

  // Waits for the end; the exit status, or -1 when it was killed by a signal, now or before.
  int Collect(Clock::time_point deadline) {
    if (handle_.IsOpen() && !WaitFor(handle_.Get(), POLLIN, deadline)) return Kill();
    // A leader that has ended may have left others of its session behind.
    return group_ == ChildGroup::kOwn ? Kill() : Reap();
  }

  // A process that was not collected yet keeps its number, so nobody else can be hit.
  int Kill() {
    siginfo_t information = {};
    const bool ours =
        waitid(P_PID, static_cast<id_t>(process_), &information, WEXITED | WNOHANG | WNOWAIT) == 0 ||
        errno != ECHILD;
    if (ours) kill(group_ == ChildGroup::kOwn ? -process_ : process_, SIGKILL);
    return Reap();
  }

 private:
  int Reap() {
    collected_ = true;
    int status = 0;
    pid_t result = -1;
    do result = waitpid(process_, &status, 0);
    while (result < 0 && errno == EINTR);
    return result == process_ && WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

  pid_t process_;
  ChildGroup group_;
  velmor::UniqueFd handle_;
  bool collected_ = false;
};

// Sends everything; false when the other side has gone or the deadline came first.
bool SendAll(int socket, std::string_view bytes, Clock::time_point deadline) {
  while (!bytes.empty()) {
    if (!WaitFor(socket, POLLOUT, deadline)) return false;
    const ssize_t sent = send(socket, bytes.data(), bytes.size(), MSG_NOSIGNAL | MSG_DONTWAIT);
    if (sent < 0 && (errno == EINTR || errno == EAGAIN)) continue;
    if (sent < 0) return false;
    bytes.remove_prefix(static_cast<size_t>(sent));
  }
  return true;
}

// Receives up to the first line end.
Conversation ReceiveLine(int socket, Clock::time_point deadline) {
  Conversation result;
  std::array<char, 4096> buffer;
  while (result.answer.size() < kLongestAnswer) {
    if (!WaitFor(socket, POLLIN, deadline)) {
      result.end = Conversation::End::kDeadline;
      return result;
    }
    const ssize_t count = recv(socket, buffer.data(), buffer.size(), MSG_DONTWAIT);
    if (count < 0 && (errno == EINTR || errno == EAGAIN)) continue;
    if (count <= 0) return result;
    result.answer.append(buffer.data(), static_cast<size_t>(count));
    if (const size_t end = result.answer.find('\n'); end != std::string::npos) {
      result.answer.resize(end);
      result.end = Conversation::End::kAnswered;
      return result;
    }
  }
  return result;
}

// Reads until the end of the output or the deadline.
std::string ReadOutput(int descriptor, Clock::time_point deadline) {
  std::string output;
  std::array<char, 4096> buffer;
  while (WaitFor(descriptor, POLLIN, deadline)) {
    const ssize_t count = read(descriptor, buffer.data(), buffer.size());
    if (count < 0 && errno == EINTR) continue;
    if (count <= 0) break;
    output.append(buffer.data(), static_cast<size_t>(count));
    if (output.size() > kLongestAnswer) output.erase(0, output.size() / 2);
  }
  return output;
}

}  // namespace

std::string LastLine(const std::string& text) {
  const size_t end = text.find_last_not_of("\r\n \t");
  if (end == std::string::npos) return "";
  const size_t lineEnd = text.find_last_of('\n', end);
  const size_t begin = lineEnd == std::string::npos ? 0 : lineEnd + 1;
  return text.substr(begin, end - begin + 1);
}

Conversation Converse(const std::string& path, ChildGroup group, ChildEnvironment environment,
                      const std::string& line, std::string_view secret, std::chrono::milliseconds limit) {
  const auto deadline = Clock::now() + limit;
  std::array<int, 2> pair = {-1, -1};
  if (socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, pair.data()) != 0) {
    throw Failure(kInternalError, "cannot make a socket pair: " + ErrorText(errno));
  }
  const velmor::UniqueFd ours(pair[0]);
  velmor::UniqueFd theirs(pair[1]);
  SpawnPlan plan(group);
  plan.ConnectBothWays(theirs.Get());
  Child child(plan, {path}, group, environment);
  theirs.Close();

  Conversation result;
  // A child that has gone, or does not read, may have answered all the same.
  SendAll(ours.Get(), line + "\n", deadline) && SendAll(ours.Get(), secret, deadline);
  result = ReceiveLine(ours.Get(), deadline);
  if (result.end == Conversation::End::kDeadline) {
    child.Kill();
  } else {
    child.Collect(std::min(deadline, Clock::now() + kEndingTime));
  }
  return result;
}

ProgramResult RunProgram(const std::vector<std::string>& command, ProgramOutput output,
                         std::chrono::milliseconds limit) {
  const auto deadline = Clock::now() + limit;
  std::array<int, 2> pipeEnds = {-1, -1};
  if (pipe2(pipeEnds.data(), O_CLOEXEC) != 0) {
    throw Failure(kInternalError, "cannot make a pipe: " + ErrorText(errno));
  }
  const velmor::UniqueFd readEnd(pipeEnds[0]);
  velmor::UniqueFd writeEnd(pipeEnds[1]);
  SpawnPlan plan(ChildGroup::kCallers);
  if (output == ProgramOutput::kWanted) {
    plan.ConnectOutput(writeEnd.Get());
  } else {
    plan.ConnectNothing();
  }
  Child child(plan, command, ChildGroup::kCallers, ChildEnvironment::kCallers);
  writeEnd.Close();

  ProgramResult result;
  result.output = ReadOutput(readEnd.Get(), deadline);
  result.exitStatus = child.Collect(deadline);
  result.timedOut = result.exitStatus < 0 && Clock::now() >= deadline;
  return result;
}

}  // namespace sambaprovider
