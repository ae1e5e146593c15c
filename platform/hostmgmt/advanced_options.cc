#include "hostmgmt/advanced_options.h"

#include <charconv>
#include <utility>

namespace HostMgmt::Adv {
namespace {

template <typename Values>
std::vector<std::string> KeysOf(const Values& values) {
  std::vector<std::string> keys;
  keys.reserve(values.size());
  for (const auto& value : values) keys.push_back(value.first);
  return keys;
}

template <typename Values>
typename Values::mapped_type FindOrEmpty(const Values& values, const std::string& name) {
  const auto found = values.find(name);
  return found == values.end() ? nullptr : found->second;
}

}  // namespace

AdvancedOption::AdvancedOption(const std::string& name) : name_(name) {}
AdvancedOption::~AdvancedOption() = default;

const std::string& AdvancedOption::GetName() const {
  return name_;
}

AdvancedIntegerOption::AdvancedIntegerOption(const std::string& name, std::int64_t value)
    : AdvancedOption(name), value_(value) {}
AdvancedIntegerOption::~AdvancedIntegerOption() = default;

std::int64_t AdvancedIntegerOption::GetValue() const {
  return value_;
}

std::string AdvancedIntegerOption::GetText() const {
  char digits[24];
  const auto result = std::to_chars(digits, digits + sizeof(digits), value_);
  return std::string(digits, result.ptr);
}

AdvancedStringOption::AdvancedStringOption(const std::string& name, const std::string& value)
    : AdvancedOption(name), value_(value) {}
AdvancedStringOption::~AdvancedStringOption() = default;

const std::string& AdvancedStringOption::GetValue() const {
  return value_;
}

std::string AdvancedStringOption::GetText() const {
  return value_;
}

AdvancedOptionBranch::AdvancedOptionBranch() = default;
AdvancedOptionBranch::~AdvancedOptionBranch() = default;

std::shared_ptr<const AdvancedOptionBranch> AdvancedOptionBranch::GetChild(const std::string& name) const {
  return FindOrEmpty(children_, name);
}

std::shared_ptr<const AdvancedOption> AdvancedOptionBranch::GetOption(const std::string& name) const {
  return FindOrEmpty(options_, name);
}

std::vector<std::string> AdvancedOptionBranch::GetChildNames() const {
  return KeysOf(children_);
}

std::vector<std::string> AdvancedOptionBranch::GetOptionNames() const {
  return KeysOf(options_);
}

void AdvancedOptionBranch::Insert(const std::vector<std::string>& branchNames,
                                  std::shared_ptr<const AdvancedOption> option) {
  AdvancedOptionBranch* branch = this;
  for (const std::string& name : branchNames) {
    std::shared_ptr<AdvancedOptionBranch>& child = branch->children_[name];
    if (!child) child = std::make_shared<AdvancedOptionBranch>();
    branch = child.get();
  }
  const std::string name = option->GetName();
  branch->options_[name] = std::move(option);
}

}  // namespace HostMgmt::Adv
