#include "password_source.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <CLI/App.hpp>
#include <cerrno>
#include <cstring>
#include <string_view>

#include "failure.h"
#include "terminal.h"
#include "text.h"
#include "velmor/unique_fd.h"

namespace velmorctl {

namespace {

Failure Unreadable(const std::string& source, const char* reason) {
  return Failure(ExitCode::Usage, "the password cannot be read from " + source + ": " + reason)
      .Try("check --password-file or --password-fd");
}

/// Reads one character at a time, so that nothing behind the line is taken from a descriptor that the caller
/// goes on using, and no copy of the password stays in a stream's buffer.
void ReadLine(int descriptor, const std::string& source, Secret& password) {
  char character = 0;
  for (;;) {
    ssize_t count = read(descriptor, &character, 1);
    if (count < 0 && errno == EINTR) {
      continue;
    }
    if (count < 0) {
      throw Unreadable(source, SystemErrorText(errno).c_str());
    }
    if (count == 0 || character == '\n') {
      break;
    }
    if (character == '\0') {
      throw Unreadable(source, "it holds a null character");
    }
    if (!password.Append(character)) {
      throw Unreadable(source, "it is too long");
    }
  }
  if (password.Length() > 0 && password.Text()[password.Length() - 1] == '\r') {
    password.RemoveLast();
  }
}

void ReadFile(const std::string& path, Secret& password) {
  int number = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOCTTY);
  if (number < 0) {
    throw Unreadable("'" + path + "'", SystemErrorText(errno).c_str());
  }
  velmor::UniqueFd file(number);
  struct stat status = {};
  if (fstat(file.Get(), &status) == 0 && S_ISREG(status.st_mode) && (status.st_mode & S_IROTH) != 0) {
    throw Failure(ExitCode::Usage, "the password file '" + path + "' can be read by everybody")
        .Try("chmod 600 '" + path + "', and change the password if others may have seen it");
  }
  ReadLine(file.Get(), "'" + path + "'", password);
}

}  // namespace

std::array<CLI::Option*, 2> PasswordSource::AddOptions(CLI::App& command) {
  CLI::Option* fileOption = command.add_option(
      "--password-file", file, "Read the password from the first line of this file ('-': standard input)");
  CLI::Option* descriptorOption =
      command.add_option("--password-fd", descriptor, "Read the password from this open descriptor")
          ->check(CLI::NonNegativeNumber)
          ->excludes(fileOption);
  return {fileOption, descriptorOption};
}

void PasswordSource::Read(const std::string& userName, Secret& password) const {
  if (descriptor) {
    ReadLine(*descriptor, "descriptor " + std::to_string(*descriptor), password);
  } else if (file == "-") {
    ReadLine(STDIN_FILENO, "standard input", password);
  } else if (!file.empty()) {
    ReadFile(file, password);
  } else {
    ReadPasswordFromTerminal("Password of " + Printable(userName) + ": ", password);
  }
  if (password.Length() == 0) {
    throw Failure(ExitCode::CredentialsRefused, "the password is empty")
        .Try("give the password of " + Printable(userName) + "; an account without one cannot join or leave");
  }
}

}  // namespace velmorctl
