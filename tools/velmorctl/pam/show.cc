/// velmorctl pam show: what libpam runs for a service.
#include <CLI/App.hpp>
#include <iostream>

#include "failure.h"
#include "output.h"
#include "pam/policy_line.h"
#include "pam/policy_root.h"
#include "pam/subcommands.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

struct Options {
  bool json = false;
  std::string root = "/";
  std::string service;
  bool all = false;
};

std::string NameOf(StackEntry::Kind kind) {
  switch (kind) {
    case StackEntry::Kind::Module:
      return "module";
    case StackEntry::Kind::Substack:
      return "substack";
    case StackEntry::Kind::AlwaysFails:
      break;
  }
  return "always-fails";
}

std::string NameOf(Policy::State state) {
  switch (state) {
    case Policy::State::Usable:
      return "usable";
    case Policy::State::Refused:
      return "refused";
    case Policy::State::Fatal:
      break;
  }
  return "fatal";
}

std::string ShownOrigin(const PolicyRoot& root, const Origin& origin) {
  return root.Shown(origin.file) + ":" + std::to_string(origin.line);
}

std::string ModuleWithArguments(const StackEntry& entry) {
  std::vector<std::string> words = {std::string(2 * entry.level, ' ') + entry.module};
  for (const std::string& argument : entry.arguments) {
    words.push_back(QuotedArgument(argument));
  }
  return Join(words, " ");
}

Json AsJson(const PolicyRoot& root, const StackEntry& entry) {
  return {{"kind", NameOf(entry.kind)},
          {"level", entry.level},
          {"control", entry.control},
          {"module", entry.module},
          {"arguments", entry.arguments},
          {"quiet", entry.quiet},
          {"file", root.Shown(entry.origin.file)},
          {"line", entry.origin.line}};
}

Json AsJson(const PolicyRoot& root, const Policy& policy) {
  Json stacks = Json::object();
  for (Facility facility : facilities) {
    Json entries = Json::array();
    for (const StackEntry& entry : policy.StackOf(facility)) {
      entries.push_back(AsJson(root, entry));
    }
    stacks[std::string(pam::NameOf(facility))] = {{"fromOther", policy.IsFromOther(facility)},
                                                  {"entries", entries}};
  }
  return {{"name", policy.service},
          {"file", root.Shown(policy.file)},
          {"state", NameOf(policy.state)},
          {"stacks", stacks}};
}

void PrintStacks(const PolicyRoot& root, const Policy& policy) {
  std::vector<std::vector<std::string>> rows = {{"FACILITY", "CONTROL", "MODULE", "FROM"}};
  for (Facility facility : facilities) {
    for (const StackEntry& entry : policy.StackOf(facility)) {
      rows.push_back({(entry.quiet ? "-" : "") + std::string(pam::NameOf(facility)), entry.control,
                      ModuleWithArguments(entry), ShownOrigin(root, entry.origin)});
    }
  }
  std::cout << Printable(policy.service) << "\n";
  PrintTable(rows);
}

/// Warnings do not belong to the output: the stacks are what libpam makes of the files, faults included.
void WarnOf(const PolicyRoot& root, const Policy& policy) {
  for (const Finding& finding : policy.findings) {
    std::cerr << "velmorctl: warning: " << Printable(ShownOrigin(root, finding.origin)) << ": "
              << Printable(finding.reason) << "\n";
  }
  if (policy.state != Policy::State::Usable) {
    std::cerr << "velmorctl: warning: libpam "
              << (policy.state == Policy::State::Refused ? "refuses" : "crashes or hangs on")
              << " the service '" << Printable(policy.service) << "'\n";
  }
}

std::vector<Policy> Policies(const Options& options, const PolicyRoot& root) {
  if (!options.all) {
    return {root.Resolve(options.service)};
  }
  std::vector<Policy> policies;
  for (const std::string& service : root.Services()) {
    policies.push_back(root.ResolveListed(service));
  }
  return policies;
}

ExitCode Show(const Options& options, Situation&) {
  if (options.all == !options.service.empty()) {
    throw Failure(ExitCode::Usage, "give either a service or --all")
        .Try("\"velmorctl pam show sshd\", for example");
  }
  PolicyRoot root{RootFolder(options.root)};
  std::vector<Policy> policies = Policies(options, root);
  Json services = Json::array();
  for (std::size_t index = 0; index < policies.size(); ++index) {
    WarnOf(root, policies[index]);
    if (options.json) {
      services.push_back(AsJson(root, policies[index]));
    } else {
      std::cout << (index > 0 ? "\n" : "");
      PrintStacks(root, policies[index]);
    }
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.pam/1"}, {"services", services}});
  }
  return ExitCode::Fine;
}

}  // namespace

void AddShow(CLI::App& pam, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* show = pam.add_subcommand("show", "Show the stacks that a service really has");
  show->add_option("SERVICE", options->service, "For example sshd");
  show->add_flag("--all", options->all, "Show those of all services");
  AddRootOption(*show, options->root);
  AddJsonFlag(*show, options->json);
  Bind(*show, invocation, options, Show);
}

}  // namespace velmorctl::pam
