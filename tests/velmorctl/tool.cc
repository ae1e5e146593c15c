#include "tool.h"

#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <system_error>

namespace velmorctltest {

namespace {

[[noreturn]] void BecomeTool(const std::vector<std::string>& arguments, int output) {
  std::vector<char*> pointers;
  for (const std::string& argument : arguments) {
    pointers.push_back(const_cast<char*>(argument.c_str()));
  }
  pointers.push_back(nullptr);
  dup2(output, STDOUT_FILENO);
  execvp(pointers.front(), pointers.data());
  _exit(127);
}

std::string ReadToEnd(int descriptor) {
  std::string text;
  char buffer[4096];
  ssize_t count = 0;
  while ((count = read(descriptor, buffer, sizeof buffer)) > 0 || (count < 0 && errno == EINTR)) {
    text.append(buffer, count > 0 ? static_cast<std::size_t>(count) : 0);
  }
  return text;
}

}  // namespace

ToolOutcome RunTool(const std::vector<std::string>& arguments) {
  int ends[2];
  if (pipe(ends) != 0) {
    throw std::system_error(errno, std::generic_category(), "pipe");
  }
  const pid_t child = fork();
  if (child < 0) {
    throw std::system_error(errno, std::generic_category(), "fork");
  }
  if (child == 0) {
    close(ends[0]);
    BecomeTool(arguments, ends[1]);
  }
  close(ends[1]);
  ToolOutcome outcome;
  outcome.output = ReadToEnd(ends[0]);
  close(ends[0]);
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  outcome.exitCode = WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  return outcome;
}

}  // namespace velmorctltest
