/// velmorctl: the administrator's command over libvelmor.
#include <signal.h>

#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <cstdlib>
#include <iostream>
#include <string>

#include "answer_watch.h"
#include "command.h"
#include "explain.h"

namespace {

using velmorctl::ExitCode;
using velmorctl::Failure;
using velmorctl::Interrupted;
using velmorctl::Invocation;
using velmorctl::Situation;

std::string HelpFooter() {
  std::string footer = "Exit codes:\n";
  for (const auto& [code, meaning] : velmorctl::ExitCodeMeanings()) {
    footer += "  " + std::to_string(static_cast<int>(code)) + "\t" + std::string(meaning) + "\n";
  }
  return footer + "See velmorctl(8).";
}

void Build(CLI::App& app, Invocation& invocation) {
  app.require_subcommand(1);
  app.footer(HelpFooter());
  app.set_version_flag("--version", "velmorctl " VELMOR_VERSION);
  for (velmorctl::AddCommand add : velmorctl::Commands()) {
    add(app, invocation);
  }
}

ExitCode Run(CLI::App& app, int count, char** arguments, Situation& situation) {
  Invocation invocation;
  Build(app, invocation);
  app.parse(count, arguments);
  ExitCode code = invocation.run(situation);
  if (!std::cout.flush()) {
    throw Failure(ExitCode::Other, "cannot write the output").Try("check where standard output goes");
  }
  return code;
}

/// Ends the process by the signal, as if it had not been caught.
[[noreturn]] void EndBySignal(int signalNumber) {
  signal(signalNumber, SIG_DFL);
  raise(signalNumber);
  std::_Exit(128 + signalNumber);
}

[[noreturn]] void End(ExitCode code) {
  std::cout.flush();
  if (velmorctl::AnswerWatch::WorkRuns()) {
    // A provider call hangs on its thread. It must not meet destroyed objects, and nobody waits for it.
    std::_Exit(static_cast<int>(code));
  }
  std::exit(static_cast<int>(code));
}

}  // namespace

int main(int count, char** arguments) {
  CLI::App app("Joins this host to an Active Directory domain, shows its state there, and leaves it.",
               "velmorctl");
  Situation situation;
  ExitCode code = ExitCode::Other;
  try {
    code = Run(app, count, arguments, situation);
  } catch (const CLI::ParseError& error) {
    code = app.exit(error) == 0 ? ExitCode::Fine : ExitCode::Usage;
  } catch (const Interrupted& interrupted) {
    Failure failure(ExitCode::Other, std::string("interrupted; ") + interrupted.what());
    std::cerr << velmorctl::FailureReport(failure, situation);
    EndBySignal(interrupted.SignalNumber());
  } catch (const std::exception& exception) {
    Failure failure = velmorctl::Explain(exception, situation);
    std::cerr << velmorctl::FailureReport(failure, situation);
    code = failure.Code();
  }
  End(code);
}
