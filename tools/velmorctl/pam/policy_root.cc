#include "pam/policy_root.h"

#include <algorithm>
#include <filesystem>
#include <system_error>

#include "active_provider.h"
#include "failure.h"
#include "pam/module_answer.h"
#include "pam/resolver.h"
#include "system_file/file_calls.h"

namespace velmorctl::pam {

namespace {

std::vector<std::string> NamesIn(const std::string& folder, std::error_code& error) {
  std::vector<std::string> names;
  std::filesystem::directory_iterator entry(folder, error);
  for (; !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) {
    names.push_back(entry->path().filename());
  }
  return names;
}

bool HasCapitals(const std::string& name) {
  return std::any_of(name.begin(), name.end(), [](char letter) { return letter >= 'A' && letter <= 'Z'; });
}

std::string NameOf(const std::string& path) {
  return path.substr(path.rfind('/') + 1);
}

bool IsLeftOver(const std::string& name) {
  return name.starts_with('.') || name.ends_with('~') || name.find(".dpkg-") != std::string::npos ||
         name.find(".ucf-") != std::string::npos;
}

bool IsFolderIn(const RootFolder& root, const std::string& path) {
  std::optional<std::string> found = root.Find(path);
  return found && IsFolder(*found);
}

/// Debian's libpam looks into one folder, whose name holds the machine's architecture, and then into
/// /lib/security.
std::vector<std::string> ModuleFolders(const RootFolder& root) {
  std::vector<std::string> folders;
  for (const char* libraries : {"/lib", "/usr/lib"}) {
    std::error_code error;
    std::vector<std::string> names = NamesIn(root.Resolve(libraries), error);
    names.emplace_back();
    for (const std::string& name : names) {
      std::string folder = std::string(libraries) + "/" + name + (name.empty() ? "" : "/") + "security";
      bool fits = name.empty() || name.find("-linux-") != std::string::npos;
      if (fits && IsFolderIn(root, folder)) {
        folders.push_back(folder);
      }
    }
  }
  return folders;
}

}  // namespace

FileReading ReadingOf(const SnapshotInspection& inspection) {
  const std::optional<FileProblem>& problem = inspection.problem;
  if (!problem) {
    return {inspection.snapshot.content, std::nullopt};
  }
  if (problem->kind == FileProblem::Kind::Missing && !inspection.snapshot.isLink) {
    return {};
  }
  return {std::nullopt, ReadingProblem{problem->reason, problem->remedy,
                                       static_cast<std::size_t>(problem->line), problem->value}};
}

PolicyRoot::PolicyRoot(RootFolder root) : root_(std::move(root)), moduleFolders_(ModuleFolders(root_)) {}

std::set<std::string> PolicyRoot::Files() const {
  std::set<std::string> files;
  bool found = false;
  for (const char* folder : policyFolders) {
    std::error_code error;
    for (const std::string& name : NamesIn(root_.Resolve(folder), error)) {
      std::string path = std::string(folder) + "/" + name;
      if (!IsLeftOver(name) && !IsFolderIn(root_, path)) {
        files.insert(std::move(path));
      }
    }
    if (error && error != std::errc::no_such_file_or_directory) {
      throw Failure(ExitCode::Configuration, "the PAM policies cannot be read: " + error.message())
          .Detail("file", root_.Shown(folder))
          .Try("run the command as root");
    }
    found = found || !error;
  }
  if (!found) {
    throw Failure(ExitCode::Configuration, "there are no PAM policies")
        .Detail("file", root_.Shown(policyFolders[0]))
        .Try("give --root the folder of a system that uses PAM");
  }
  return files;
}

std::vector<std::string> PolicyRoot::Services() const {
  std::set<std::string> services;
  for (const std::string& file : Files()) {
    if (!HasCapitals(NameOf(file))) {
      services.insert(NameOf(file));
    }
  }
  return {services.begin(), services.end()};
}

std::vector<std::string> PolicyRoot::FilesWithCapitals() const {
  std::set<std::string> files = Files();
  std::erase_if(files, [](const std::string& file) { return !HasCapitals(NameOf(file)); });
  return {files.begin(), files.end()};
}

FileReading PolicyRoot::Read(const std::string& path) const {
  if (IsFolderIn(root_, path)) {
    return {"",
            ReadingProblem{"it is a folder", "put a text file there, or correct or remove the line", 0, ""}};
  }
  return ReadingOf(InspectSystemFile(root_, path));
}

bool PolicyRoot::HasModule(const std::string& module) const {
  if (module.starts_with('/')) {
    return HasFile(module);
  }
  return moduleFolders_.empty() ||
         std::any_of(moduleFolders_.begin(), moduleFolders_.end(),
                     [this, &module](const std::string& folder) { return HasFile(folder + "/" + module); });
}

bool PolicyRoot::HasFile(const std::string& path) const {
  std::optional<std::string> found = root_.Find(path);
  std::error_code error;
  return found && std::filesystem::is_regular_file(*found, error);
}

std::set<std::string> PolicyRoot::DirectoryModules() const {
  std::set<std::string> modules = CommonDirectoryModules();
  try {
    modules.insert(ModuleName(ActiveProvider(root_).pamModule));
  } catch (const Failure&) {
    // Policies can be looked at where no provider is set up, too.
  }
  return modules;
}

CheckedSystem PolicyRoot::System() const {
  return {[this](const std::string& path) { return Read(path); },
          [this](const std::string& module) { return HasModule(module); },
          [this](const std::string& path) { return HasFile(path); }, DirectoryModules()};
}

Policy PolicyRoot::Resolve(const std::string& service) const {
  if (!IsServiceName(service)) {
    throw Failure(ExitCode::Usage, "'" + service + "' cannot be the name of a service")
        .Try("give the name of a file in " + root_.Shown(policyFolders[0]) + ", for example sshd");
  }
  Policy policy = ResolveListed(service);
  for (const char* folder : policyFolders) {
    SnapshotInspection inspection = InspectSystemFile(root_, std::string(folder) + "/" + policy.service);
    if (inspection.problem && inspection.problem->kind != FileProblem::Kind::Missing) {
      throw AsFailure(*inspection.problem, ExitCode::Configuration,
                      "cannot read the service '" + policy.service + "'");
    }
    if (!inspection.problem) {
      return policy;
    }
  }
  throw Failure(ExitCode::Configuration, "there is no service '" + policy.service + "'")
      .Detail("file", root_.Shown(std::string(policyFolders[0]) + "/" + policy.service))
      .Try("\"velmorctl pam show --all\" shows the services; for one without a file libpam takes \"other\"");
}

Policy PolicyRoot::ResolveListed(const std::string& service) const {
  return ResolvePolicy(service, [this](const std::string& path) { return Read(path); });
}

Person PolicyRoot::FindUser(const std::string& name) const {
  UserFiles files = {Read("/etc/passwd").content.value_or(""), Read("/etc/group").content.value_or(""),
                     Read("/etc/shadow").content};
  return FindPerson(name, files);
}

FileProblem PolicyRoot::Shown(const Finding& finding) const {
  FileProblem problem = {};
  problem.kind = FileProblem::Kind::Malformed;
  problem.file = root_.Shown(finding.origin.file);
  problem.line = static_cast<int>(finding.origin.line);
  problem.value = finding.value;
  problem.reason = finding.reason;
  problem.remedy = finding.remedy;
  return problem;
}

}  // namespace velmorctl::pam
