#include "failure.h"
#include "pam/policy_line.h"
#include "pam/policy_text.h"
#include "pam_edit/edit_plan.h"
#include "pam_edit/host_policies.h"
#include "pam_edit/model_agreement.h"
#include "pam_edit/own_line.h"
#include "pam_edit/profile_change.h"

namespace velmorctl::pam {

namespace {

OwnModules OwnModulesIn(const Draft& draft, const WrittenPolicies& written) {
  OwnModules own = ModulesOfProfile(draft);
  for (const auto& [file, content] : written.contents) {
    std::vector<std::string> modules = ModulesOfOwnLines(content);
    own.insert(modules.begin(), modules.end());
  }
  return own;
}

std::string RestoreRemedy(const RootFolder& root) {
  return "velmorctl pam restore" + root.Option() + ", if nothing else was changed since";
}

void RequireAsBefore(const Policies& before, const Policies& after, const RootFolder& root,
                     const OwnModules& own) {
  for (std::size_t index = 0; index < before.size(); ++index) {
    std::string problem = UnexpectedDifference(after[index], before[index], own);
    if (!problem.empty()) {
      throw Failure(ExitCode::HostNotReady,
                    "the service '" + before[index].service + "' would not be what it was without the module")
          .Detail("reason", problem)
          .Try(RestoreRemedy(root));
    }
  }
}

void RequireModelAgrees(const WrittenPolicies& before, const WrittenPolicies& after, const RootFolder& root,
                        const OwnModules& own) {
  for (const auto& [file, content] : before.contents) {
    auto now = after.contents.find(file);
    if (now != after.contents.end() && !ModelSeesOwnRemoved(content, now->second, own)) {
      throw Failure(ExitCode::HostNotReady, "a policy file would not be what it was without the module")
          .Detail("file", root.Shown(file))
          .Detail("reason", "read another way, it would change in more than was asked for")
          .Try(RestoreRemedy(root));
    }
  }
}

std::vector<std::string> NotesOnRemaining(const WrittenPolicies& written, const std::string& module) {
  std::vector<std::string> notes;
  for (const auto& [file, content] : written.contents) {
    PolicyText text(content);
    for (const LogicalLine& logical : text.Lines()) {
      PolicyLine line = ReadPolicyLine(logical.text);
      if (line.kind == PolicyLine::Kind::Module && ModuleName(line.target) == ModuleName(module)) {
        notes.push_back(Place({file, logical.firstLine}) + " calls " + line.target +
                        " too; velmorctl did not write that, and it stays.");
      }
    }
  }
  return notes;
}

}  // namespace

EditPlan PlanDisable(const RootFolder& root, const std::optional<DirectoryModule>& module) {
  Draft current(root);
  WrittenPolicies before = ReadAllWritten(current);
  Draft bare = WithoutOwn(current, before);
  WrittenPolicies after = ReadAllWritten(bare);
  OwnModules own = OwnModulesIn(current, before);
  RequireAsBefore(ResolveAll(current), ResolveAll(bare), root, own);
  RequireModelAgrees(before, after, root, own);
  std::vector<std::string> notes = NotesOnUnreadable(before);
  if (module) {
    std::vector<std::string> remaining = NotesOnRemaining(after, module->name);
    notes.insert(notes.end(), remaining.begin(), remaining.end());
  }
  return {std::move(bare), std::move(notes), {}};
}

}  // namespace velmorctl::pam
