#include "pam_edit/edit_spot.h"

#include <algorithm>
#include <tuple>

#include "pam_edit/placement.h"
#include "pam_edit/profile_change.h"

namespace velmorctl::pam {

namespace {

constexpr char localModule[] = "pam_unix";

const StackEntry* FindEntry(const Stack& stack, const std::string& module) {
  auto found = std::find_if(stack.begin(), stack.end(), [&module](const StackEntry& entry) {
    return entry.kind == StackEntry::Kind::Module && ModuleName(entry.module) == module;
  });
  return found == stack.end() ? nullptr : &*found;
}

/// Why the file must not be edited by hand; else empty.
std::string ProblemOfFile(const Draft& draft, const std::string& file) {
  for (const char* folder : policyFolders) {
    if (draft.SameFile(file, std::string(folder) + "/" + otherService)) {
      return "it has no stack of its own for this, and the service \"other\" is left alone";
    }
  }
  if (file.starts_with(std::string(policyFolders[1]) + "/")) {
    return "the file " + file + " belongs to a package; copy it to " + policyFolders[0] +
           " to have it changed";
  }
  return {};
}

EditSpots SpotBeside(const Draft& draft, const StackEntry& local, Facility facility,
                     const DirectoryModule& module) {
  EditSpot spot = {local.origin.file, local.origin.line, true, {}};
  if (IsKeptByProfiles(draft, spot.file)) {
    return {{spot}, ""};
  }
  spot.byProfile = false;
  Placement placement = PlaceBeside(local, facility, module);
  spot.lines = placement.lines;
  std::string problem = ProblemOfFile(draft, spot.file);
  return {{spot}, problem.empty() ? placement.problem : problem};
}

bool IsNeeded(Facility facility) {
  return facility == Facility::Auth || facility == Facility::Account;
}

}  // namespace

bool EditSpot::operator<(const EditSpot& other) const {
  return std::tie(file, line) < std::tie(other.file, other.line);
}

const StackEntry* AuthEntryOf(const Policy& policy, const std::string& module) {
  return FindEntry(policy.StackOf(Facility::Auth), ModuleName(module));
}

EditSpots FindEditSpots(const Draft& draft, const Policy& policy, const DirectoryModule& module) {
  EditSpots found;
  for (Facility facility : facilities) {
    const StackEntry* local = FindEntry(policy.StackOf(facility), localModule);
    std::string problem;
    if (local != nullptr) {
      EditSpots beside = SpotBeside(draft, *local, facility, module);
      problem = beside.problem;
      if (problem.empty()) {
        found.spots.push_back(beside.spots.front());
      }
    } else {
      problem = "pam_unix.so is not there to put the module beside it";
    }
    if (!problem.empty() && IsNeeded(facility)) {
      found.problem = std::string(NameOf(facility)) + ": " + problem;
      return found;
    }
  }
  return found;
}

}  // namespace velmorctl::pam
