#ifndef HOSTMGMT_ADVANCED_OPTIONS_H
#define HOSTMGMT_ADVANCED_OPTIONS_H

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "hostmgmt/export.h"

namespace HostMgmt::Adv {

/// One advanced option as it was when the tree was read. Options are immutable: HostMgmt::Host sets them.
class HOSTMGMT_EXPORT AdvancedOption {
 public:
  virtual ~AdvancedOption();

  /// The name within its branch, for example "ActiveDirectoryVerifyCAMCertificate".
  const std::string& GetName() const;

  /// The value as text for people, without quotes.
  virtual std::string GetText() const = 0;

 protected:
  explicit AdvancedOption(const std::string& name);
  AdvancedOption(const AdvancedOption&) = delete;
  AdvancedOption& operator=(const AdvancedOption&) = delete;

 private:
  std::string name_;
};

/// An option whose value is an integer.
class HOSTMGMT_EXPORT AdvancedIntegerOption : public AdvancedOption {
 public:
  AdvancedIntegerOption(const std::string& name, std::int64_t value);
  ~AdvancedIntegerOption() override;

  std::int64_t GetValue() const;
  std::string GetText() const override;

 private:
  std::int64_t value_;
};

/// An option whose value is text.
class HOSTMGMT_EXPORT AdvancedStringOption : public AdvancedOption {
 public:
  AdvancedStringOption(const std::string& name, const std::string& value);
  ~AdvancedStringOption() override;

  const std::string& GetValue() const;
  std::string GetText() const override;

 private:
  std::string value_;
};

/// A branch of the tree of advanced options; the tree is its root branch. A snapshot: it does not follow
/// later changes, and may be read from several threads. Names compare exactly, letter case included.
class HOSTMGMT_EXPORT AdvancedOptionBranch {
 public:
  AdvancedOptionBranch();
  ~AdvancedOptionBranch();
  AdvancedOptionBranch(const AdvancedOptionBranch&) = delete;
  AdvancedOptionBranch& operator=(const AdvancedOptionBranch&) = delete;

  /// The child branch of that name, or an empty reference.
  std::shared_ptr<const AdvancedOptionBranch> GetChild(const std::string& name) const;

  /// The option of that name, or an empty reference. Its type is found with std::dynamic_pointer_cast.
  std::shared_ptr<const AdvancedOption> GetOption(const std::string& name) const;

  /// The names of the child branches, sorted.
  std::vector<std::string> GetChildNames() const;

  /// The names of the options of this branch, sorted.
  std::vector<std::string> GetOptionNames() const;

  /// For whoever builds a tree: puts the option below the branch that `branchNames` leads to from here, whose
  /// missing parts are made. Replaces an option of the same name.
  void Insert(const std::vector<std::string>& branchNames, std::shared_ptr<const AdvancedOption> option);

 private:
  std::map<std::string, std::shared_ptr<AdvancedOptionBranch>> children_;
  std::map<std::string, std::shared_ptr<const AdvancedOption>> options_;
};

}  // namespace HostMgmt::Adv

#endif
