/// velmorctl pam simulate: whether a login would succeed, and why.
#include <CLI/App.hpp>
#include <iostream>

#include "failure.h"
#include "output.h"
#include "pam/login.h"
#include "pam/policy_root.h"
#include "pam/subcommands.h"
#include "text.h"

namespace velmorctl::pam {

namespace {

struct Options {
  bool json = false;
  std::string root = "/";
  std::string service;
  std::string user;
  std::string directory;
  std::vector<std::string> answers;
};

std::vector<AnswerOverride> ReadOverrides(const std::vector<std::string>& texts) {
  std::vector<AnswerOverride> overrides;
  for (const std::string& text : texts) {
    std::optional<AnswerOverride> override = ReadAnswerOverride(text);
    if (!override) {
      throw Failure(ExitCode::Usage, "'" + text + "' is no answer of a module")
          .Try("write it as [FACILITY:]MODULE[#OCCURRENCE]=ANSWER, for example auth:pam_unix=auth_err");
    }
    overrides.push_back(*override);
  }
  return overrides;
}

Circumstances CircumstancesOf(const Options& options, const PolicyRoot& root) {
  CheckedSystem system = root.System();
  Circumstances circumstances;
  circumstances.user = root.FindUser(options.user);
  circumstances.service = options.service;
  circumstances.directoryUp = options.directory == "up";
  circumstances.directoryModules = std::move(system.directoryModules);
  circumstances.moduleExists = std::move(system.moduleExists);
  circumstances.fileExists = std::move(system.fileExists);
  return circumstances;
}

const StackEntry& EntryOf(const Policy& policy, const LoginCall& call, const Step& step) {
  return policy.StackOf(FacilityFor(call.operation))[step.entry];
}

std::string ActionText(const Step& step) {
  std::string text = step.action.kind == Action::Kind::Jump ? "jump " : "";
  return text + NameOf(step.action) + (step.badJump ? " (out of the stack)" : "");
}

Json AsJson(const PolicyRoot& root, const Policy& policy, const LoginCall& call) {
  Json steps = Json::array();
  for (std::size_t index = 0; index < call.verdict.trace.size(); ++index) {
    const Step& step = call.verdict.trace[index];
    const StackEntry& entry = EntryOf(policy, call, step);
    steps.push_back({{"module", entry.module},
                     {"file", root.Shown(entry.origin.file)},
                     {"line", entry.origin.line},
                     {"control", entry.control},
                     {"answer", NameOf(step.answer)},
                     {"action", NameOf(step.action)},
                     {"badJump", step.badJump},
                     {"verdict", NameOf(step.verdict)},
                     {"note", call.notes[index]}});
  }
  return {{"call", NameOf(call.operation)}, {"verdict", NameOf(call.verdict.code)}, {"steps", steps}};
}

void PrintJsonOutcome(const Options& options, const PolicyRoot& root, const Policy& policy,
                      const LoginOutcome& outcome) {
  Json calls = Json::array();
  for (const LoginCall& call : outcome.calls) {
    calls.push_back(AsJson(root, policy, call));
  }
  PrintJson({{"schema", "velmor.pam-simulate/1"},
             {"service", policy.service},
             {"user", options.user},
             {"directory", options.directory},
             {"succeeds", outcome.succeeds},
             {"reason", outcome.reason},
             {"calls", calls}});
}

void PrintOutcome(const Options& options, const PolicyRoot& root, const Policy& policy,
                  const LoginOutcome& outcome) {
  std::vector<std::vector<std::string>> rows = {{"CALL", "MODULE", "ANSWER", "ACTION", "FROM", "NOTE"}};
  for (const LoginCall& call : outcome.calls) {
    for (std::size_t index = 0; index < call.verdict.trace.size(); ++index) {
      const Step& step = call.verdict.trace[index];
      const StackEntry& entry = EntryOf(policy, call, step);
      rows.push_back(
          {std::string(NameOf(call.operation)), entry.module, NameOf(step.answer), ActionText(step),
           root.Shown(entry.origin.file) + ":" + std::to_string(entry.origin.line), call.notes[index]});
    }
    rows.push_back({std::string(NameOf(call.operation)), "", NameOf(call.verdict.code), "verdict", "", ""});
  }
  PrintTable(rows);
  std::cout << "The login of '" << Printable(options.user) << "' to '" << Printable(policy.service) << "' "
            << (outcome.succeeds ? "would succeed" : "would fail") << ": " << Printable(outcome.reason)
            << "\n";
}

ExitCode Simulate(const Options& options, Situation&) {
  std::vector<AnswerOverride> overrides = ReadOverrides(options.answers);
  PolicyRoot root{RootFolder(options.root)};
  Policy policy = root.Resolve(options.service);
  LoginOutcome outcome = SimulateLogin(policy, CircumstancesOf(options, root), overrides);
  if (options.json) {
    PrintJsonOutcome(options, root, policy, outcome);
  } else {
    PrintOutcome(options, root, policy, outcome);
  }
  return outcome.succeeds ? ExitCode::Fine : ExitCode::Difference;
}

}  // namespace

void AddSimulate(CLI::App& pam, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* simulate = pam.add_subcommand("simulate", "Tell whether a login would succeed, and why");
  simulate->add_option("SERVICE", options->service, "For example sshd")->required();
  simulate->add_option("--user", options->user, "Who logs in, with the right password")->required();
  simulate->add_option("--directory", options->directory, "Whether the directory is \"up\" or \"down\"")
      ->required()
      ->check(CLI::IsMember({"up", "down"}));
  simulate->add_option("--answer", options->answers,
                       "What a module answers: [FACILITY:]MODULE[#OCCURRENCE]=ANSWER");
  AddRootOption(*simulate, options->root);
  AddJsonFlag(*simulate, options->json);
  Bind(*simulate, invocation, options, Simulate);
}

}  // namespace velmorctl::pam
