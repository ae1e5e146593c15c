#include "program.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <system_error>

#include "support/files.h"

namespace velmorctltest {

namespace {

constexpr int firstDescriptor = 10;

void Redirect(const std::string& path, int flags, int descriptor) {
  const int opened = open(path.c_str(), flags, 0600);
  if (opened < 0 || dup2(opened, descriptor) < 0) {
    _exit(126);
  }
  close(opened);
}

Outcome OutcomeOf(int status) {
  Outcome outcome;
  if (WIFEXITED(status)) {
    outcome.exitCode = WEXITSTATUS(status);
  } else {
    outcome.signalNumber = WTERMSIG(status);
    outcome.leftCoreFile = WCOREDUMP(status);
  }
  return outcome;
}

/// A prefix for the files of one run, which no other run has.
std::string NewFiles() {
  static int count = 0;
  return "/run/velmorctl-run" + std::to_string(++count);
}

}  // namespace

Setting WithInput(const std::string& standardInput) {
  Setting setting;
  setting.standardInput = standardInput;
  return setting;
}

Setting WithDescriptor(const std::string& content) {
  Setting setting;
  setting.descriptorContents = {content};
  return setting;
}

Setting WithOutputTo(const std::string& path) {
  Setting setting;
  setting.outputTo = path;
  return setting;
}

Setting WithErrorsTo(const std::string& path) {
  Setting setting;
  setting.errorsTo = path;
  return setting;
}

Setting WithoutRoot() {
  Setting setting;
  setting.asRoot = false;
  return setting;
}

void BecomeProgram(const std::vector<std::string>& arguments, bool asRoot) {
  // In a user namespace without a mapping nobody is root.
  if (!asRoot && unshare(CLONE_NEWUSER) != 0) {
    _exit(126);
  }
  std::vector<char*> pointers = {const_cast<char*>("velmorctl")};
  for (const std::string& argument : arguments) {
    pointers.push_back(const_cast<char*>(argument.c_str()));
  }
  pointers.push_back(nullptr);
  execv(VELMORCTL_PROGRAM, pointers.data());
  _exit(126);
}

RunningProgram::RunningProgram(const std::vector<std::string>& arguments, const Setting& setting)
    : files_(NewFiles()),
      output_(setting.outputTo.empty() ? files_ + ".out" : setting.outputTo),
      errors_(setting.errorsTo.empty() ? files_ + ".err" : setting.errorsTo) {
  testsupport::WriteFile(files_ + ".in", setting.standardInput);
  for (std::size_t index = 0; index < setting.descriptorContents.size(); ++index) {
    testsupport::WriteFile(files_ + ".fd" + std::to_string(index), setting.descriptorContents[index]);
  }
  process_ = fork();
  if (process_ < 0) {
    throw std::system_error(errno, std::generic_category(), "fork");
  }
  if (process_ == 0) {
    Redirect(files_ + ".in", O_RDONLY, STDIN_FILENO);
    Redirect(output_, O_WRONLY | O_CREAT, STDOUT_FILENO);
    Redirect(errors_, O_WRONLY | O_CREAT | O_APPEND, STDERR_FILENO);
    for (std::size_t index = 0; index < setting.descriptorContents.size(); ++index) {
      Redirect(files_ + ".fd" + std::to_string(index), O_RDONLY, firstDescriptor + static_cast<int>(index));
    }
    setsid();  // Without a terminal to ask at.
    BecomeProgram(arguments, setting.asRoot);
  }
}

RunningProgram::~RunningProgram() {
  if (!ended_) {
    kill(process_, SIGKILL);
    waitpid(process_, nullptr, 0);
  }
}

void RunningProgram::Signal(int number) const {
  kill(process_, number);
}

std::string RunningProgram::ErrorsSoFar() const {
  return testsupport::Exists(errors_) ? testsupport::ReadFile(errors_) : "";
}

Outcome RunningProgram::Wait() {
  int status = 0;
  while (waitpid(process_, &status, 0) < 0 && errno == EINTR) {
  }
  ended_ = true;
  Outcome outcome = OutcomeOf(status);
  if (output_ == files_ + ".out") {
    outcome.output = testsupport::ReadFile(output_);
  }
  if (errors_ == files_ + ".err") {
    outcome.errors = testsupport::ReadFile(errors_);
  }
  return outcome;
}

Outcome Velmorctl(const std::vector<std::string>& arguments, const Setting& setting) {
  return RunningProgram(arguments, setting).Wait();
}

}  // namespace velmorctltest
