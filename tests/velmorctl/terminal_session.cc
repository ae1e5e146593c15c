#include "terminal_session.h"

#include <fcntl.h>
#include <poll.h>
#include <pty.h>
#include <sys/wait.h>
#include <termios.h>
#include <unistd.h>
#include <utmp.h>

#include <cerrno>
#include <csignal>
#include <stdexcept>
#include <system_error>

namespace velmorctltest {

namespace {

void Report(int descriptor, int number) {
  if (write(descriptor, &number, sizeof(number)) != sizeof(number)) {
    _exit(126);
  }
}

/// What a shell does for one command, until it is killed.
[[noreturn]] void Lead(int terminal, int reports, const std::vector<std::string>& arguments) {
  signal(SIGTTOU, SIG_IGN);
  if (login_tty(terminal) != 0) {
    _exit(126);
  }
  const pid_t process = fork();
  if (process == 0) {
    setpgid(0, 0);
    tcsetpgrp(STDIN_FILENO, getpid());
    signal(SIGTTOU, SIG_DFL);
    BecomeProgram(arguments, true);
  }
  Report(reports, process);
  int status = 0;
  do {
    waitpid(process, &status, WUNTRACED);
    Report(reports, status);
  } while (WIFSTOPPED(status));
  // At the leader's end the terminal would be taken away.
  for (;;) {
    pause();
  }
}

}  // namespace

TerminalSession::TerminalSession(const std::vector<std::string>& arguments) {
  int reportEnds[2];
  if (openpty(&master_, &terminal_, nullptr, nullptr, nullptr) != 0 || pipe2(reportEnds, O_CLOEXEC) != 0) {
    throw std::system_error(errno, std::generic_category(), "openpty");
  }
  leader_ = fork();
  if (leader_ < 0) {
    throw std::system_error(errno, std::generic_category(), "fork");
  }
  if (leader_ == 0) {
    close(master_);
    Lead(terminal_, reportEnds[1], arguments);
  }
  close(reportEnds[1]);
  reports_ = reportEnds[0];
  process_ = ReadReport();
  fcntl(master_, F_SETFL, O_NONBLOCK);
}

TerminalSession::~TerminalSession() {
  kill(process_, SIGKILL);
  kill(leader_, SIGKILL);
  waitpid(leader_, nullptr, 0);
  close(reports_);
  close(terminal_);
  close(master_);
}

int TerminalSession::ReadReport() {
  int number = 0;
  if (read(reports_, &number, sizeof(number)) != sizeof(number)) {
    throw std::runtime_error("the session's leader has ended");
  }
  return number;
}

void TerminalSession::ReadShown(int timeoutMilliseconds) {
  pollfd wait = {master_, POLLIN, 0};
  if (poll(&wait, 1, timeoutMilliseconds) <= 0) {
    return;
  }
  char buffer[1024];
  const ssize_t count = read(master_, buffer, sizeof(buffer));
  if (count > 0) {
    shown_.append(buffer, static_cast<std::size_t>(count));
  }
}

bool TerminalSession::AwaitText(const std::string& text) {
  return Eventually([this, &text] {
    ReadShown(50);
    return shown_.find(text) != std::string::npos;
  });
}

void TerminalSession::Type(const std::string& keys) const {
  if (write(master_, keys.data(), keys.size()) != static_cast<ssize_t>(keys.size())) {
    throw std::system_error(errno, std::generic_category(), "typing");
  }
}

bool TerminalSession::Echoes() const {
  termios settings = {};
  if (tcgetattr(terminal_, &settings) != 0) {
    throw std::system_error(errno, std::generic_category(), "tcgetattr");
  }
  return (settings.c_lflag & ECHO) != 0;
}

bool TerminalSession::AwaitStop() {
  return WIFSTOPPED(ReadReport());
}

void TerminalSession::Signal(int number) const {
  kill(process_, number);
}

Outcome TerminalSession::Wait() {
  pollfd report = {reports_, POLLIN, 0};
  while (poll(&report, 1, 0) == 0) {
    ReadShown(20);
  }
  const int status = ReadReport();
  ReadShown(0);
  Outcome outcome;
  if (WIFEXITED(status)) {
    outcome.exitCode = WEXITSTATUS(status);
  } else {
    outcome.signalNumber = WTERMSIG(status);
  }
  outcome.output = shown_;
  return outcome;
}

}  // namespace velmorctltest
