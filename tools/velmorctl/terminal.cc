#include "terminal.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <termios.h>
#include <unistd.h>

#include <cerrno>
#include <optional>
#include <string_view>
#include <system_error>

#include "failure.h"
#include "signal_pipe.h"

namespace velmorctl {

namespace {

/// The controlling terminal with its echo off, until this object ends.
class SilentTerminal {
 public:
  SilentTerminal() : descriptor_(open("/dev/tty", O_RDWR | O_CLOEXEC | O_NOCTTY)) {
    if (descriptor_ < 0 || tcgetattr(descriptor_, &settings_) != 0) {
      Close();
      throw Failure(ExitCode::Usage, "there is no terminal to ask for the password at")
          .Try("give the password with --password-file or --password-fd");
    }
    termios silent = settings_;
    silent.c_lflag &= ~static_cast<tcflag_t>(ECHO | ECHONL);
    tcsetattr(descriptor_, TCSAFLUSH, &silent);
  }
  SilentTerminal(const SilentTerminal&) = delete;
  SilentTerminal& operator=(const SilentTerminal&) = delete;

  ~SilentTerminal() {
    tcsetattr(descriptor_, TCSAFLUSH, &settings_);
    Close();
  }

  int Descriptor() const noexcept { return descriptor_; }

  void Write(std::string_view text) const {
    while (!text.empty()) {
      ssize_t written = write(descriptor_, text.data(), text.size());
      if (written < 0) {
        return;
      }
      text.remove_prefix(static_cast<std::size_t>(written));
    }
  }

 private:
  void Close() const {
    if (descriptor_ >= 0) {
      close(descriptor_);
    }
  }

  int descriptor_;
  termios settings_ = {};
};

/// Reads one character; true when it ends the line.
bool ReadCharacter(const SilentTerminal& terminal, Secret& password) {
  char character = 0;
  ssize_t count = read(terminal.Descriptor(), &character, 1);
  if (count < 0) {
    throw std::system_error(errno, std::generic_category(), "reading the password from the terminal");
  }
  if (count == 0) {
    throw Failure(ExitCode::Usage, "the terminal ended before the password did");
  }
  if (character == '\n') {
    return true;
  }
  if (!password.Append(character)) {
    throw Failure(ExitCode::Usage, "the password is too long");
  }
  return false;
}

/// Asks once; returns the signal that came before the line was complete.
std::optional<int> AskOnce(const std::string& prompt, Secret& password) {
  // The pipe is there before the echo is off and until it is on again, so that no signal can end the process
  // in between.
  SignalPipe signals{SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGTSTP};
  SilentTerminal terminal;
  terminal.Write(prompt);
  pollfd waits[] = {{signals.Descriptor(), POLLIN, 0}, {terminal.Descriptor(), POLLIN, 0}};
  for (;;) {
    if (poll(waits, 2, -1) < 0 && errno != EINTR) {
      throw std::system_error(errno, std::generic_category(), "waiting for the password");
    }
    if (std::optional<int> signalNumber = signals.Take()) {
      terminal.Write("\n");
      return signalNumber;
    }
    // One character at a time, so that a signal is seen also when a line without its end was sent.
    if (waits[1].revents != 0 && ReadCharacter(terminal, password)) {
      terminal.Write("\n");
      return std::nullopt;
    }
  }
}

}  // namespace

void ReadPasswordFromTerminal(const std::string& prompt, Secret& password) {
  while (std::optional<int> signalNumber = AskOnce(prompt, password)) {
    password.Clear();
    if (*signalNumber != SIGTSTP) {
      throw Interrupted(*signalNumber, "nothing was changed");
    }
    raise(SIGTSTP);
  }
}

}  // namespace velmorctl
