/// velmorctl option: the host's advanced options.
#include <CLI/App.hpp>
#include <charconv>
#include <iostream>

#include "command.h"
#include "failure.h"
#include "hostmgmt/advanced_options.h"
#include "hostmgmt/host.h"
#include "output.h"

namespace velmorctl {

namespace {

using HostMgmt::Adv::AdvancedIntegerOption;
using HostMgmt::Adv::AdvancedOption;
using HostMgmt::Adv::AdvancedOptionBranch;
using OptionByPath = std::map<std::string, std::shared_ptr<const AdvancedOption>>;

struct Options {
  bool json = false;
  std::string path;
  std::string value;
  bool text = false;
};

void Collect(const AdvancedOptionBranch& branch, const std::string& prefix, OptionByPath& found) {
  for (const std::string& name : branch.GetOptionNames()) {
    found[prefix + name] = branch.GetOption(name);
  }
  for (const std::string& name : branch.GetChildNames()) {
    Collect(*branch.GetChild(name), prefix + name + ".", found);
  }
}

OptionByPath AllOptions() {
  OptionByPath found;
  if (std::shared_ptr<const AdvancedOptionBranch> root =
          HostMgmt::HostFactory::GetHost()->GetAdvancedOptions()) {
    Collect(*root, "", found);
  }
  return found;
}

const AdvancedIntegerOption* AsInteger(const AdvancedOption& option) {
  return dynamic_cast<const AdvancedIntegerOption*>(&option);
}

Json AsJson(const std::string& path, const AdvancedOption& option) {
  const AdvancedIntegerOption* integer = AsInteger(option);
  return {{"name", path},
          {"type", integer != nullptr ? "integer" : "text"},
          {"value", integer != nullptr ? Json(integer->GetValue()) : Json(option.GetText())}};
}

ExitCode Get(const Options& options, Situation& situation) {
  situation.doing = "read the advanced options";
  situation.platformFailure = ExitCode::Configuration;
  OptionByPath found = AllOptions();
  if (!options.path.empty()) {
    auto wanted = found.find(options.path);
    if (wanted == found.end()) {
      throw Failure(ExitCode::Configuration, "there is no option '" + options.path + "'")
          .Try("\"velmorctl option get\" shows the options that are set");
    }
    found = {*wanted};
  }
  Json entries = Json::array();
  std::vector<std::vector<std::string>> rows;
  for (const auto& [path, option] : found) {
    entries.push_back(AsJson(path, *option));
    rows.push_back(options.path.empty() ? std::vector{path, option->GetText()}
                                        : std::vector{option->GetText()});
  }
  if (options.json) {
    PrintJson({{"schema", "velmor.options/1"}, {"options", entries}});
  } else {
    PrintTable(rows);
  }
  return ExitCode::Fine;
}

std::optional<std::int64_t> ParseInteger(const std::string& text) {
  std::int64_t value = 0;
  const char* end = text.data() + text.size();
  auto [stop, error] = std::from_chars(text.data(), end, value);
  return error == std::errc() && stop == end && !text.empty() ? std::optional(value) : std::nullopt;
}

/// An option keeps its type; a new one is an integer when its value looks like one.
ExitCode Set(const Options& options, Situation& situation) {
  RequireRoot("set an option");
  situation.doing = "set the option '" + options.path + "'";
  situation.platformFailure = ExitCode::Configuration;
  OptionByPath found = AllOptions();
  auto current = found.find(options.path);
  bool wasInteger = current != found.end() && AsInteger(*current->second) != nullptr;
  bool wasText = current != found.end() && !wasInteger;
  std::optional<std::int64_t> integer = ParseInteger(options.value);
  if (wasInteger && !options.text && !integer) {
    throw Failure(ExitCode::Usage,
                  "the option '" + options.path + "' takes an integer, not '" + options.value + "'")
        .Try("give an integer, or --text to make it an option with text");
  }
  std::shared_ptr<HostMgmt::Host> host = HostMgmt::HostFactory::GetHost();
  if (integer && !options.text && !wasText) {
    host->SetIntegerOption(options.path, *integer);
  } else {
    host->SetStringOption(options.path, options.value);
  }
  std::cout << options.path << " = " << options.value << "\n";
  return ExitCode::Fine;
}

}  // namespace

void AddOptionCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* option = root.add_subcommand("option", "Show or set advanced options of the host");
  option->require_subcommand(1);
  CLI::App* get = option->add_subcommand("get", "Show the options, or one of them");
  get->add_option("NAME", options->path, "For example UserVars.ActiveDirectoryVerifyCAMCertificate");
  AddJsonFlag(*get, options->json);
  Bind(*get, invocation, options, Get);
  CLI::App* set = option->add_subcommand("set", "Set an option");
  set->add_option("NAME", options->path, "For example UserVars.ActiveDirectoryVerifyCAMCertificate")
      ->required();
  set->add_option("VALUE", options->value, "An integer, or text")->required();
  set->add_flag("--text", options->text, "Store the value as text, whatever it looks like");
  Bind(*set, invocation, options, Set);
}

}  // namespace velmorctl
