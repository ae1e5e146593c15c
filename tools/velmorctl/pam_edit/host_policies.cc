#include "pam_edit/host_policies.h"

#include <utility>

#include "pam/policy_root.h"
#include "pam/resolver.h"
#include "pam_edit/own_line.h"
#include "pam_edit/profile_change.h"
#include "pam_edit/stack_difference.h"

namespace velmorctl::pam {

Policies ResolveAll(const Draft& draft) {
  FileReader reader = draft.Reader();
  Policies policies;
  for (const std::string& service : PolicyRoot(draft.Root()).Services()) {
    policies.push_back(ResolvePolicy(service, reader));
  }
  return policies;
}

std::vector<std::string> FilesOfService(const std::string& service) {
  std::vector<std::string> files;
  for (const char* folder : policyFolders) {
    files.push_back(std::string(folder) + "/" + service);
  }
  return files;
}

WrittenPolicies ReadAllWritten(const Draft& draft) {
  PolicyRoot root(draft.Root());
  std::vector<std::string> files = root.FilesWithCapitals();
  for (const std::string& service : root.Services()) {
    for (std::string& file : FilesOfService(service)) {
      files.push_back(std::move(file));
    }
  }
  return ReadWrittenPolicies(std::move(files), draft.Reader());
}

Draft WithoutOwn(Draft draft, const WrittenPolicies& written) {
  for (const auto& [file, content] : written.contents) {
    std::string rest = WithoutOwnLines(content);
    if (rest != content) {
      draft.Write(file, rest);
    }
  }
  RemoveProfile(draft);
  return draft;
}

std::string UnexpectedDifference(const Policy& without, const Policy& with, const OwnModules& own) {
  if (without.state != with.state) {
    return "libpam would not read it as before";
  }
  for (Facility facility : facilities) {
    std::string difference = UnexpectedDifference(without.StackOf(facility), with.StackOf(facility), own);
    if (!difference.empty()) {
      return difference;
    }
  }
  return {};
}

std::vector<std::string> NotesOnUnreadable(const WrittenPolicies& written) {
  std::vector<std::string> notes;
  for (const auto& [file, problem] : written.unreadable) {
    notes.push_back(file + " cannot be read (" + problem + "), and stays as it is.");
  }
  return notes;
}

std::string Place(const Origin& origin) {
  return origin.file + ", line " + std::to_string(origin.line);
}

}  // namespace velmorctl::pam
