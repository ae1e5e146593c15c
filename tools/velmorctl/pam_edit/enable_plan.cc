#include <algorithm>
#include <set>

#include "failure.h"
#include "pam/check.h"
#include "pam/login.h"
#include "pam/policy_root.h"
#include "pam/resolver.h"
#include "pam_edit/edit_plan.h"
#include "pam_edit/edit_spot.h"
#include "pam_edit/host_policies.h"
#include "pam_edit/login_proof.h"
#include "pam_edit/model_agreement.h"
#include "pam_edit/own_line.h"
#include "pam_edit/profile_change.h"

namespace velmorctl::pam {

namespace {

std::set<std::string> FilesOf(const Policy& policy) {
  std::set<std::string> files;
  for (const Stack& stack : policy.stacks) {
    for (const StackEntry& entry : stack) {
      files.insert(entry.origin.file);
    }
  }
  return files;
}

std::size_t OwnLinesIn(const Draft& draft, const std::string& file) {
  return ModulesOfOwnLines(draft.Reader()(file).content.value_or("")).size();
}

class EnablePlanner {
 public:
  EnablePlanner(const RootFolder& root, const DirectoryModule& module)
      : module_(module),
        current_(root),
        written_(ReadAllWritten(current_)),
        bare_(WithoutOwn(current_, written_)),
        policies_(ResolveAll(bare_)) {}

  EditPlan Run() {
    Choose();
    for (;;) {
      Draft next = Draw();
      std::vector<Refusal> refused = Prove(next);
      if (refused.empty()) {
        RequireKept(next);
        NoteShutOut(next);
        NoteUnreadable();
        return {std::move(next), std::move(notes_), std::move(refusals_)};
      }
      for (Refusal& refusal : refused) {
        Drop(std::move(refusal));
      }
    }
  }

 private:
  /// A service that is to be changed.
  struct Meant {
    std::string service;
    std::vector<EditSpot> spots;
  };

  const Policy& PolicyOf(const std::string& service) const {
    return *std::find_if(policies_.begin(), policies_.end(),
                         [&service](const Policy& policy) { return policy.service == service; });
  }

  void Choose() {
    for (const Policy& policy : policies_) {
      if (!IsLoginService(policy, {})) {
        continue;
      }
      if (const StackEntry* there = AuthEntryOf(policy, module_.name)) {
        LeaveAsItIs(policy, *there);
        continue;
      }
      EditSpots found = FindEditSpots(bare_, policy, module_);
      if (found.problem.empty()) {
        meant_.push_back({policy.service, std::move(found.spots)});
      } else {
        refusals_.push_back({policy.service, found.problem});
      }
    }
    if (meant_.empty() && notes_.empty() && refusals_.empty()) {
      throw Failure(ExitCode::HostNotReady, "there is no service through which people log in")
          .Detail("reason",
                  "no auth stack below " + bare_.Root().Shown(policyFolders[0]) + " reaches pam_unix.so")
          .Try("velmorctl pam check" + bare_.Root().Option());
    }
  }

  /// The module is there by the administrator's hand, or by a profile of the distribution.
  void LeaveAsItIs(const Policy& policy, const StackEntry& there) {
    std::string shutOut = ShutOut(policy, policy, module_.name);
    if (!shutOut.empty()) {
      refusals_.push_back(
          {policy.service, Place(there.origin) + " calls " + there.module + " already, but " + shutOut});
      return;
    }
    std::string profile =
        IsKeptByProfiles(bare_, there.origin.file) ? ProfileWithModule(bare_, there.module) : "";
    AddNote(Place(there.origin) + " calls " + there.module + " already" +
            (profile.empty() ? "" : " by the profile \"" + profile + "\" of pam-auth-update") +
            "; the services that use it stay as they are.");
  }

  void AddNote(const std::string& note) {
    if (std::find(notes_.begin(), notes_.end(), note) == notes_.end()) {
      notes_.push_back(note);
    }
  }

  bool IsDropped(const EditSpot& spot) const {
    return spot.byProfile ? profileDropped_ : droppedFiles_.contains(spot.file);
  }

  /// The spots of all services that are meant to change, from the end of each file to its beginning, so that
  /// the numbers of the lines hold.
  std::vector<EditSpot> Spots() const {
    std::set<EditSpot> spots;
    for (const Meant& meant : meant_) {
      spots.insert(meant.spots.begin(), meant.spots.end());
    }
    std::erase_if(spots, [this](const EditSpot& spot) { return IsDropped(spot); });
    return {spots.rbegin(), spots.rend()};
  }

  Draft Draw() const {
    Draft next = bare_;
    std::vector<EditSpot> spots = Spots();
    if (std::any_of(spots.begin(), spots.end(), [](const EditSpot& spot) { return spot.byProfile; })) {
      AddProfile(next, module_);
    }
    for (const EditSpot& spot : spots) {
      std::string content = next.RequiredContent(spot.file);
      std::size_t anchor = spot.line;
      for (const OwnLine& line : spot.lines) {
        content = WithOwnLine(content, anchor, line);
        // Another one goes before this one, which stands below its comment.
        anchor += line.side == OwnLine::Side::Before ? 1 : 0;
      }
      next.Write(spot.file, content);
    }
    return next;
  }

  std::vector<Refusal> Prove(const Draft& next) const {
    std::vector<Refusal> refused;
    FileReader reader = next.Reader();
    for (const Policy& before : policies_) {
      std::string reason = ProblemOf(before, ResolvePolicy(before.service, reader), next);
      if (!reason.empty()) {
        refused.push_back({before.service, reason});
      }
    }
    if (refused.empty()) {
      refused = ShutOutServices(next);
      std::vector<Refusal> all = refused;
      std::erase_if(refused, [&](const Refusal& refusal) { return ServesOthers(refusal.service, all); });
    }
    return refused;
  }

  const Meant* FindMeant(const std::string& service) const {
    auto found = std::find_if(meant_.begin(), meant_.end(),
                              [&service](const Meant& meant) { return meant.service == service; });
    return found == meant_.end() ? nullptr : &*found;
  }

  /// The services that would be changed to no avail.
  std::vector<Refusal> ShutOutServices(const Draft& next) const {
    std::vector<Refusal> shutOut;
    FileReader reader = next.Reader();
    for (const Meant& meant : meant_) {
      const Policy& before = PolicyOf(meant.service);
      std::string reason = ShutOut(before, ResolvePolicy(meant.service, reader), module_.name);
      if (!reason.empty()) {
        shutOut.push_back({meant.service, reason});
      }
    }
    return shutOut;
  }

  /// Whether a file that would be changed for the service is one that lets people in elsewhere. Leaving it
  /// alone would take the directory from services that have nothing to do with this one.
  bool ServesOthers(const std::string& service, const std::vector<Refusal>& shutOut) const {
    const std::vector<EditSpot>& spots = FindMeant(service)->spots;
    return std::any_of(meant_.begin(), meant_.end(), [&](const Meant& other) {
      bool isShutOut = std::any_of(shutOut.begin(), shutOut.end(), [&other](const Refusal& refusal) {
        return refusal.service == other.service;
      });
      return !isShutOut && std::any_of(spots.begin(), spots.end(), [&other](const EditSpot& spot) {
        return std::any_of(other.spots.begin(), other.spots.end(),
                           [&spot](const EditSpot& its) { return its.file == spot.file; });
      });
    });
  }

  void NoteShutOut(const Draft& next) {
    for (const Refusal& refusal : ShutOutServices(next)) {
      AddNote("the service '" + refusal.service + "' shares changed files with others, but " +
              refusal.reason + ".");
    }
  }

  void NoteUnreadable() {
    for (const std::string& note : NotesOnUnreadable(written_)) {
      AddNote(note);
    }
  }

  /// A refused service is to stay as it is, and one that libpam cannot use is somebody's mistake: what an
  /// earlier "enable" has put in must not go by the way.
  void RequireKept(const Draft& next) const {
    // Behind the services that share files with it stands the one that is the reason.
    for (auto refusal = refusals_.rbegin(); refusal != refusals_.rend(); ++refusal) {
      RequireKept(next, *refusal);
    }
    for (const Policy& policy : policies_) {
      if (policy.state != Policy::State::Usable) {
        RequireKept(next, {policy.service, WhyUnusable(policy)});
      }
    }
  }

  void RequireKept(const Draft& next, const Refusal& refusal) const {
    bool profileGoes = !ModulesOfProfile(current_).empty() && ModulesOfProfile(next).empty();
    std::set<std::string> files = FilesOf(PolicyOf(refusal.service));
    WrittenPolicies written = ReadWrittenPolicies(FilesOfService(refusal.service), current_.Reader());
    for (const auto& [file, content] : written.contents) {
      files.insert(file);
    }
    for (const std::string& file : files) {
      bool linesGo = OwnLinesIn(next, file) < OwnLinesIn(current_, file);
      if (linesGo || (profileGoes && IsKeptByProfiles(bare_, file))) {
        throw Failure(ExitCode::HostNotReady,
                      "the service '" + refusal.service + "' cannot keep what was put into its files")
            .Detail("file", bare_.Root().Shown(file))
            .Detail("reason", refusal.reason)
            .Try("correct or remove the service; nothing was changed");
      }
    }
  }

  /// Why the service must not become what it would; else empty.
  std::string ProblemOf(const Policy& before, const Policy& after, const Draft& next) const {
    std::string problem = UnexpectedDifference(before, after, {module_.name});
    if (problem.empty()) {
      problem = ProblemOfFiles(before, next);
    }
    return problem.empty() ? UnsafeChange(before, after, module_.name) : problem;
  }

  std::string ProblemOfFiles(const Policy& policy, const Draft& next) const {
    for (const std::string& file : FilesOf(policy)) {
      std::string before = bare_.Content(file).value_or("");
      std::string after = next.Content(file).value_or("");
      if (!ModelSeesOwnAdded(before, after, {module_.name})) {
        return "read another way, " + file + " would change in more than was asked for";
      }
      if (!IsKeptByProfiles(bare_, file) && WithoutOwnLines(after) != before) {
        return "the change of " + file + " could not be undone byte for byte";
      }
    }
    return {};
  }

  /// Leaves the service as it is, and with it the files that it shares and the services that need these
  /// changed.
  void Drop(Refusal refusal) {
    std::set<std::string> files = FilesOf(PolicyOf(refusal.service));
    auto isShared = [&](const EditSpot& spot) { return files.contains(spot.file); };
    for (const EditSpot& spot : Spots()) {
      if (isShared(spot) && spot.byProfile) {
        profileDropped_ = true;
      } else if (isShared(spot)) {
        droppedFiles_.insert(spot.file);
      }
    }
    std::vector<Meant> kept;
    for (Meant& meant : meant_) {
      auto dropped = std::find_if(meant.spots.begin(), meant.spots.end(),
                                  [this](const EditSpot& spot) { return IsDropped(spot); });
      if (meant.service == refusal.service) {
        continue;
      }
      if (dropped == meant.spots.end()) {
        kept.push_back(std::move(meant));
      } else {
        refusals_.push_back({meant.service, "it shares " + dropped->file + " with " + refusal.service +
                                                ", which stays as it is"});
      }
    }
    meant_ = std::move(kept);
    std::erase_if(refusals_, [&](const Refusal& other) { return other.service == refusal.service; });
    refusals_.push_back(std::move(refusal));
  }

  const DirectoryModule& module_;
  Draft current_;
  WrittenPolicies written_;
  Draft bare_;
  Policies policies_;
  std::vector<Meant> meant_;
  std::set<std::string> droppedFiles_;
  bool profileDropped_ = false;
  std::vector<std::string> notes_;
  std::vector<Refusal> refusals_;
};

void RequireModule(const RootFolder& root, const DirectoryModule& module) {
  if (!PolicyRoot(root).HasModule(module.name)) {
    std::string name = ModuleName(module.name);
    std::replace(name.begin(), name.end(), '_', '-');
    throw Failure(ExitCode::HostNotReady,
                  "the PAM module of the provider '" + module.provider + "' is not there")
        .Detail("value", module.name)
        .Try("install the package that brings it; Debian's is called lib" + name);
  }
}

}  // namespace

EditPlan PlanEnable(const RootFolder& root, const DirectoryModule& module) {
  RequireModule(root, module);
  return EnablePlanner(root, module).Run();
}

}  // namespace velmorctl::pam
