// velmor-sandbox PROGRAM [ARGUMENT...]
//
// Runs a program in namespaces of its own, so that it can use the real fixed paths and change the host's name
// and network without touching the machine. Works as root, and for others through a user namespace.
//
// The program sees: an overlay over /etc with known hosts, resolv.conf, nsswitch.conf and hostname files; an
// empty /etc/quenix that holds an empty velmor; empty /usr/libexec/velmor, /var/lib/quenix, /var/lib/samba
// and /run; a /proc of its process namespace; a loopback interface that is up and no other; the host name
// "sandbox". All else, the build folder included, is as on the machine.
//
// Ends as the program ended: with its exit status, or by its signal. Exits with 125 when the sandbox cannot
// be made. When either of the two ends, every process in the sandbox is killed.

#include <dirent.h>
#include <fcntl.h>
#include <net/if.h>
#include <poll.h>
#include <sched.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <sys/personality.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace {

constexpr int SANDBOX_FAILED = 125;
constexpr const char* HOST_NAME = "sandbox";
/// Upper and work folders of the overlays lie here until the empty /run is mounted over them.
const std::string SCRATCH = "/run/";

[[noreturn]] void Fail(const std::string& what) {
  std::fprintf(stderr, "velmor-sandbox: cannot %s: %s\n", what.c_str(), std::strerror(errno));
  std::_Exit(SANDBOX_FAILED);
}

bool IsFolder(const std::string& path) {
  struct stat status {};
  return stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

void MakeFolder(const std::string& path) {
  if (mkdir(path.c_str(), 0755) != 0) {
    Fail("create " + path);
  }
}

void WriteFile(const std::string& path, const std::string& content) {
  std::ofstream stream(path, std::ios::trunc);
  if (!(stream << content).flush()) {
    Fail("write " + path);
  }
}

void MountEmpty(const std::string& path) {
  if (mount("sandbox", path.c_str(), "tmpfs", MS_NOSUID, "mode=755") != 0) {
    Fail("mount an empty folder on " + path);
  }
}

/// The overlay's upper folder, which the caller may fill before MountOverlay.
std::string UpperFolder(const std::string& name) {
  MakeFolder(SCRATCH + name + ".work");
  MakeFolder(SCRATCH + name);
  return SCRATCH + name;
}

void MountOverlay(const std::string& path, const std::string& upper) {
  const std::string options = "lowerdir=" + path + ",upperdir=" + upper + ",workdir=" + upper + ".work";
  if (mount("sandbox", path.c_str(), "overlay", 0, options.c_str()) != 0) {
    Fail("mount an overlay on " + path);
  }
}

/// Copies a file that can be read, with its mode and, where that is possible, its owner.
void CopyFile(const std::string& from, const std::string& to, const struct stat& status) {
  std::ifstream source(from, std::ios::binary);
  if (!source) {
    return;
  }
  WriteFile(to, std::string(std::istreambuf_iterator<char>(source), {}));
  const bool ownerKept = chown(to.c_str(), status.st_uid, status.st_gid) == 0;
  if (chmod(to.c_str(), ownerKept ? status.st_mode & 07777 : status.st_mode & 0777) != 0) {
    Fail("set the mode of " + to);
  }
}

/// Copies the plain files that stand directly in `from`. In a user namespace an overlay cannot copy up a file
/// whose owner has no number there, and nowhere does it show files that are mount points of their own.
void CopyPlainFiles(const std::string& from, const std::string& to) {
  DIR* folder = opendir(from.c_str());
  if (folder == nullptr) {
    Fail("read " + from);
  }
  while (const dirent* entry = readdir(folder)) {
    const std::string name = std::string("/").append(entry->d_name);
    struct stat status {};
    if (stat((from + name).c_str(), &status) == 0 && S_ISREG(status.st_mode)) {
      CopyFile(from + name, to + name, status);
    }
  }
  closedir(folder);
}

void MountEtc() {
  const std::string upper = UpperFolder("etc");
  CopyPlainFiles("/etc", upper);
  WriteFile(upper + "/hosts", "127.0.0.1 localhost\n");
  WriteFile(upper + "/hostname", std::string(HOST_NAME) + "\n");
  WriteFile(upper + "/resolv.conf", "nameserver 127.0.0.1\noptions timeout:1 attempts:1\n");
  WriteFile(upper + "/nsswitch.conf", "passwd: files\ngroup: files\nhosts: files dns\n");
  MountOverlay("/etc", upper);
}

/// Makes `path` an empty folder. What is missing of it is made inside an overlay over the folder that exists.
void MakeEmpty(const std::string& path) {
  std::vector<std::string> missing;
  std::string existing = path;
  while (!IsFolder(existing)) {
    missing.push_back(existing);
    existing.resize(existing.rfind('/'));
  }
  if (!missing.empty() && existing.compare(0, 4, "/etc") != 0) {
    static int count = 0;
    MountOverlay(existing, UpperFolder("overlay" + std::to_string(++count)));
  }
  for (auto folder = missing.rbegin(); folder != missing.rend(); ++folder) {
    MakeFolder(*folder);
  }
  MountEmpty(path);
}

/// A log socket that lies in /dev itself would lead out of the sandbox.
void HideLogSocket() {
  struct stat status {};
  if (lstat("/dev/log", &status) == 0 && S_ISSOCK(status.st_mode) &&
      mount("/dev/null", "/dev/log", nullptr, MS_BIND, nullptr) != 0) {
    Fail("hide /dev/log");
  }
}

void MountAll() {
  if (mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) {
    Fail("make the mounts private");
  }
  MountEmpty("/run");
  MountEtc();
  MakeEmpty("/etc/quenix");
  MakeFolder("/etc/quenix/velmor");
  MakeEmpty("/usr/libexec/velmor");
  MakeEmpty("/var/lib/quenix");
  MakeEmpty("/var/lib/samba");
  if (mount("proc", "/proc", "proc", MS_NOSUID | MS_NODEV | MS_NOEXEC, nullptr) != 0) {
    Fail("mount /proc");
  }
  HideLogSocket();
  MountEmpty("/run");
  MakeFolder("/run/lock");
  // Test programs look for this file before they change anything.
  WriteFile("/run/velmor-sandbox", "");
}

void RaiseLoopback() {
  const int descriptor = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  ifreq request{};
  std::strcpy(request.ifr_name, "lo");
  request.ifr_flags = IFF_UP | IFF_RUNNING;
  if (descriptor < 0 || ioctl(descriptor, SIOCSIFFLAGS, &request) != 0) {
    Fail("raise the loopback interface");
  }
  close(descriptor);
}

/// Becomes root of a new user namespace.
void EnterUserNamespace() {
  const std::string user = std::to_string(geteuid());
  const std::string group = std::to_string(getegid());
  if (unshare(CLONE_NEWUSER) != 0) {
    Fail("make a user namespace");
  }
  WriteFile("/proc/self/setgroups", "deny");
  WriteFile("/proc/self/uid_map", "0 " + user + " 1");
  WriteFile("/proc/self/gid_map", "0 " + group + " 1");
}

sigset_t BlockSignals() {
  sigset_t signals;
  sigemptyset(&signals);
  for (const int signal : {SIGCHLD, SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGUSR1, SIGUSR2, SIGCONT}) {
    sigaddset(&signals, signal);
  }
  sigprocmask(SIG_BLOCK, &signals, nullptr);
  return signals;
}

/// Waits for `child`, handing on every signal and reaping what else has ended. Returns its wait status.
int WaitAndForward(pid_t child, const sigset_t& signals) {
  while (true) {
    siginfo_t information{};
    const int signal = sigwaitinfo(&signals, &information);
    if (signal > 0 && signal != SIGCHLD) {
      kill(child, signal);
    }
    int status = 0;
    for (pid_t ended = waitpid(-1, &status, WNOHANG); ended > 0; ended = waitpid(-1, &status, WNOHANG)) {
      if (ended == child) {
        return status;
      }
    }
  }
}

/// The sandbox's first process: when it ends, the kernel kills all others.
[[noreturn]] void RunInside(char** program, const sigset_t& signals, int lifeline, int report) {
  prctl(PR_SET_PDEATHSIG, SIGKILL);
  pollfd watch{lifeline, 0, 0};
  if (poll(&watch, 1, 0) != 0) {
    std::_Exit(SANDBOX_FAILED);  // The launcher ended before its death could be signalled.
  }
  MountAll();
  RaiseLoopback();
  if (sethostname(HOST_NAME, std::strlen(HOST_NAME)) != 0) {
    Fail("set the host name");
  }
  const pid_t child = fork();
  if (child < 0) {
    Fail("start a process");
  }
  if (child == 0) {
    sigprocmask(SIG_UNBLOCK, &signals, nullptr);
    execvp(program[0], program);
    Fail(std::string("run ") + program[0]);
  }
  const int status = WaitAndForward(child, signals);
  if (write(report, &status, sizeof status) != sizeof status) {
    Fail("report the status");
  }
  std::_Exit(0);
}

[[noreturn]] void EndAs(int status) {
  if (WIFSIGNALED(status)) {
    const rlimit noCore{0, 0};
    setrlimit(RLIMIT_CORE, &noCore);
    sigset_t all;
    sigfillset(&all);
    signal(WTERMSIG(status), SIG_DFL);
    sigprocmask(SIG_UNBLOCK, &all, nullptr);
    raise(WTERMSIG(status));
  }
  std::_Exit(WIFEXITED(status) ? WEXITSTATUS(status) : SANDBOX_FAILED);
}

}  // namespace

int main(int count, char** arguments) {
  if (count < 2) {
    std::fprintf(stderr, "usage: velmor-sandbox PROGRAM [ARGUMENT...]\n");
    return SANDBOX_FAILED;
  }
  // ThreadSanitizer cannot place its shadow when the kernel randomises addresses widely.
  personality(ADDR_NO_RANDOMIZE);
  if (geteuid() != 0) {
    EnterUserNamespace();
  }
  if (unshare(CLONE_NEWNS | CLONE_NEWUTS | CLONE_NEWNET | CLONE_NEWPID | CLONE_NEWIPC) != 0) {
    Fail("make namespaces");
  }
  const sigset_t signals = BlockSignals();
  int lifeline[2];
  int report[2];
  if (pipe2(lifeline, O_CLOEXEC) != 0 || pipe2(report, O_CLOEXEC) != 0) {
    Fail("make a pipe");
  }
  const pid_t inside = fork();
  if (inside < 0) {
    Fail("start a process");
  }
  if (inside == 0) {
    close(lifeline[1]);
    close(report[0]);
    RunInside(arguments + 1, signals, lifeline[0], report[1]);
  }
  close(lifeline[0]);
  close(report[1]);
  const int insideStatus = WaitAndForward(inside, signals);
  int status = 0;
  if (read(report[0], &status, sizeof status) != sizeof status) {
    EndAs(insideStatus);
  }
  EndAs(status);
}
