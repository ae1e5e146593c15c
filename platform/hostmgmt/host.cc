#include "hostmgmt/host.h"

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "hostmgmt/options_file.h"
#include "system/edit_lock.h"

namespace HostMgmt {
namespace {

/// The options that every host has, until its file says otherwise.
std::map<std::string, OptionValue> DefaultOptions() {
  return {
      {"Net.ManagementInterface", std::string()},
      {"UserVars.ActiveDirectoryVerifyCAMCertificate", std::int64_t{1}},
  };
}

std::map<std::string, OptionValue> CurrentOptions() {
  std::map<std::string, OptionValue> options = OptionsFile().GetValues();
  options.merge(DefaultOptions());
  return options;
}

std::vector<std::string> SplitPath(const std::string& path) {
  std::vector<std::string> names;
  std::size_t start = 0;
  for (std::size_t dot = path.find('.'); dot != std::string::npos; dot = path.find('.', start)) {
    names.push_back(path.substr(start, dot - start));
    start = dot + 1;
  }
  names.push_back(path.substr(start));
  return names;
}

std::shared_ptr<const Adv::AdvancedOption> MakeOption(const std::string& name, const OptionValue& value) {
  if (const auto* number = std::get_if<std::int64_t>(&value)) {
    return std::make_shared<Adv::AdvancedIntegerOption>(name, *number);
  }
  if (const auto* text = std::get_if<std::string>(&value)) {
    return std::make_shared<Adv::AdvancedStringOption>(name, *text);
  }
  return nullptr;
}

void SetOption(const std::string& path, const OptionValue& value) {
  const System::EditLock lock("options", OptionsFile::kPath);
  OptionsFile file;
  file.Set(path, value);
  file.Save();
}

}  // namespace

Host::Host() = default;

std::shared_ptr<const Adv::AdvancedOptionBranch> Host::GetAdvancedOptions() const {
  const auto root = std::make_shared<Adv::AdvancedOptionBranch>();
  for (const auto& [path, value] : CurrentOptions()) {
    std::vector<std::string> names = SplitPath(path);
    const auto option = MakeOption(names.back(), value);
    names.pop_back();
    if (option) root->Insert(names, option);
  }
  return root->GetChildNames().empty() ? nullptr : root;
}

void Host::SetIntegerOption(const std::string& path, std::int64_t value) {
  SetOption(path, value);
}

void Host::SetStringOption(const std::string& path, const std::string& value) {
  SetOption(path, value);
}

void Host::ResetOption(const std::string& path) {
  const System::EditLock lock("options", OptionsFile::kPath);
  OptionsFile file;
  if (file.GetValues().count(path) == 0) return;
  file.Remove(path);
  file.Save();
}

std::shared_ptr<Host> HostFactory::GetHost() {
  return std::make_shared<Host>();
}

}  // namespace HostMgmt
