// velmor-camd: makes computer accounts for hosts that ask for one.
#include <malloc.h>
#include <sys/stat.h>
#include <syslog.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <cstdlib>
#include <string>

#include "service/service.h"
#include "service/token_commands.h"

namespace {

constexpr int kUsageError = 2;
constexpr int kErased = 0xa5;

struct CommandLine {
  std::string path = "/etc/quenix/velmor/camd.conf";
  bool check = false;
  std::string tokenFor;
  int tokenHours = 24;
  std::string tokenId;
  CLI::App* add = nullptr;
  CLI::App* list = nullptr;
  CLI::App* remove = nullptr;
};

void Declare(CLI::App& app, CommandLine& line) {
  app.add_option("--config", line.path, "The configuration file")->capture_default_str();
  app.add_flag("--check", line.check, "Only check the configuration file");
  CLI::App* token = app.add_subcommand("token", "One-use tokens")->require_subcommand(1);
  line.add = token->add_subcommand("add", "Make a token, and print it");
  line.add->add_option("--host-name", line.tokenFor, "Pattern of the host names that it is for");
  line.add->add_option("--hours", line.tokenHours, "How long it may be used")
      ->capture_default_str()
      ->check(CLI::Range(1, 24 * 365));
  line.list = token->add_subcommand("list", "List the tokens");
  line.remove = token->add_subcommand("remove", "Remove a token");
  line.remove->add_option("TOKEN", line.tokenId, "What `token list` calls it")->required();
}

int Run(const CommandLine& line) {
  if (line.add->parsed()) {
    camd::AddToken(line.path, line.tokenFor, std::chrono::hours(line.tokenHours));
  } else if (line.list->parsed()) {
    camd::ListTokens(line.path);
  } else if (line.remove->parsed()) {
    if (!camd::RemoveToken(line.path, line.tokenId)) throw std::runtime_error("there is no such token");
  } else if (line.check) {
    camd::Check(line.path);
  } else {
    camd::Serve(line.path);
  }
  return EXIT_SUCCESS;
}

}  // namespace

int main(int count, char** arguments) {
  // The libraries for HTTP and TLS keep copies of what they send and receive; this way they are overwritten
  // when they are freed. Not so pieces of up to 1032 bytes, but what those libraries keep text in is larger.
  mallopt(M_PERTURB, kErased);
  // The ledger and the audit log are nobody else's business.
  umask(S_IRWXG | S_IRWXO);
  openlog("velmor-camd", LOG_PID, LOG_DAEMON);
  CLI::App app("Makes computer accounts for hosts that ask for one");
  CommandLine line;
  Declare(app, line);
  try {
    app.parse(count, arguments);
  } catch (const CLI::ParseError& error) {
    return app.exit(error) == 0 ? EXIT_SUCCESS : kUsageError;
  }
  try {
    return Run(line);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "velmor-camd: %s\n", error.what());
    return EXIT_FAILURE;
  }
}
