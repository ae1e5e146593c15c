#include "progress.h"

#include <unistd.h>

#include <cstdio>
#include <iostream>

#include "text.h"

namespace velmorctl {

namespace {

/// How often a line is written while nothing happens, where there is no terminal to show a clock on.
constexpr std::chrono::seconds signOfLife{15};

}  // namespace

Progress::Progress(const std::string& provider)
    : start_(std::chrono::steady_clock::now()),
      lastLine_(start_),
      record_(provider),
      provider_(provider),
      terminal_(isatty(STDERR_FILENO) == 1) {}

Progress::~Progress() {
  EraseClock();
}

void Progress::Step(const std::string& text) {
  EraseClock();
  step_ = text;
  std::cerr << Elapsed() << Printable(text) << std::endl;
  lastLine_ = std::chrono::steady_clock::now();
}

void Progress::Tick() {
  for (const AttemptRecord::Line& line : record_.TakeNew()) {
    std::string status = line.status == 0 ? "" : " (status " + std::to_string(line.status) + ")";
    if (line.status != 0) {
      providerReason_ = line.text;
    }
    Step(provider_ + ": " + line.step + ": " + line.text + status);
  }
  if (terminal_) {
    EraseClock();
    std::cerr << Elapsed() << "..." << std::flush;
    clockShown_ = true;
  } else if (std::chrono::steady_clock::now() - lastLine_ >= signOfLife) {
    std::string step = step_;
    Step("still at: " + step);
    step_ = step;
  }
}

std::string Progress::Elapsed() const {
  std::chrono::duration<double> elapsed = std::chrono::steady_clock::now() - start_;
  char text[32];
  std::snprintf(text, sizeof(text), "[%6.1f s] ", elapsed.count());
  return text;
}

void Progress::EraseClock() {
  if (clockShown_) {
    std::cerr << "\r\033[K" << std::flush;
    clockShown_ = false;
  }
}

}  // namespace velmorctl
