#include "pam/resolver.h"

#include <algorithm>
#include <optional>

#include "pam/policy_line.h"
#include "pam/policy_text.h"

namespace velmorctl::pam {

namespace {

/// libpam's own limit; a substack beyond it fails.
constexpr std::size_t substackLimit = 16;

/// Ours, for what would keep libpam busy, or crash it.
constexpr std::size_t includeLimit = 200;
constexpr std::size_t lineLimit = 10000;

constexpr char overwhelmed[] = "take out the include that leads back here";

/// The policy would bring libpam down; the finding that says so has been added.
struct FatalPolicy {};

std::string Lower(std::string text) {
  for (char& letter : text) {
    letter = letter >= 'A' && letter <= 'Z' ? static_cast<char>(letter - 'A' + 'a') : letter;
  }
  return text;
}

using Effect = PolicyLine::Effect;
using Stacks = std::array<Stack, facilities.size()>;

std::string RemedyFor(Effect effect, const PolicyLine& line) {
  if (effect == Effect::AlwaysBad) {
    return "write required, requisite, sufficient, optional or a list such as [success=ok default=bad]; "
           "as it stands, every answer of the module counts as bad";
  }
  if (line.kind != PolicyLine::Kind::Module && line.target.empty()) {
    return "name a file, or remove the line; as it stands, libpam crashes";
  }
  return effect == Effect::WholeFails ? "correct or remove the line; as it stands, libpam refuses the service"
                                      : "correct or remove the line; as it stands, it always fails";
}

/// Reads one service's file, with all that it includes, into stacks.
class FileResolver {
 public:
  FileResolver(const FileReader& read, std::vector<Finding>& findings, Stacks& stacks)
      : read_(read), findings_(findings), stacks_(stacks) {}

  /// False when libpam refuses what the file says.
  bool Parse(const std::string& path, const std::string& content) {
    return ParseContent({path, 0, std::nullopt}, content);
  }

 private:
  /// A file on the way to the line that is read.
  struct Frame {
    std::string path;
    std::size_t level;
    std::optional<Facility> requested;  /// only lines of this facility count; all when none

    bool operator==(const Frame&) const = default;
  };

  void Report(Origin origin, const std::string& value, const std::string& reason, const std::string& remedy) {
    Finding finding = {std::move(origin), value, reason, remedy};
    if (std::find(findings_.begin(), findings_.end(), finding) == findings_.end()) {
      findings_.push_back(std::move(finding));
    }
  }

  bool ParseContent(const Frame& frame, const std::string& content) {
    PolicyText text(content);
    frames_.push_back(frame);
    bool usable = true;
    for (std::size_t index = 0; usable && index < text.Lines().size(); ++index) {
      usable = ParseLine(frame, text.Lines()[index]);
    }
    frames_.pop_back();
    return usable && CheckEnd(frame, text);
  }

  bool CheckEnd(const Frame& frame, const PolicyText& text) {
    Origin origin = {frame.path, text.EndLine()};
    switch (text.HowItEnds()) {
      case PolicyText::End::Complete:
        return true;
      case PolicyText::End::Unfinished:
        Report(origin, "\\", "the file ends in a line that a backslash continues; libpam refuses the file",
               "remove the backslash, or add the rest of the line");
        return false;
      case PolicyText::End::Endless:
        Report(origin, "\\",
               "a backslash continues the line at its 1023rd byte; libpam never returns from it",
               "shorten the line");
        break;
    }
    throw FatalPolicy();
  }

  void CheckLine(const Frame& frame, const LogicalLine& logical, const PolicyLine& line) {
    Origin origin = {frame.path, logical.firstLine};
    if (++lines_ > lineLimit) {
      Report(origin, "", "with all includes there are more than 10000 lines", overwhelmed);
      throw FatalPolicy();
    }
    if (logical.cut) {
      Report(origin, "", "the line has more than 1023 bytes; libpam reads the rest as a line of its own",
             "shorten the line, or continue it on the next with a backslash");
    }
    if (!line.problem.empty()) {
      Report(origin, line.problemValue, line.problem, RemedyFor(line.effect, line));
    }
    if (line.effect == Effect::Crashes) {
      throw FatalPolicy();
    }
  }

  /// The facility whose stack the line is for. libpam takes a word that it does not know for the most
  /// sensitive facility.
  static std::optional<Facility> FacilityOfLine(const Frame& frame, const PolicyLine& line) {
    if (line.kind == PolicyLine::Kind::IncludeWhole) {
      return frame.requested;
    }
    return line.facility ? line.facility : frame.requested.value_or(Facility::Auth);
  }

  bool ParseLine(const Frame& frame, const LogicalLine& logical) {
    PolicyLine line = ReadPolicyLine(logical.text);
    std::optional<Facility> facility = FacilityOfLine(frame, line);
    if (frame.requested && facility != frame.requested) {
      return true;
    }
    CheckLine(frame, logical, line);
    Origin origin = {frame.path, logical.firstLine};
    if (line.kind == PolicyLine::Kind::Module) {
      return AddModule(frame, *facility, line, origin);
    }
    if (line.kind == PolicyLine::Kind::Substack) {
      Add(StackEntry::Kind::Substack, frame, *facility, line, origin);
    }
    std::size_t level = frame.level + (line.kind == PolicyLine::Kind::Substack ? 1 : 0);
    if (Load({IncludedPath(line.target), level, facility}, line, origin)) {
      return true;
    }
    // Deliberate: what an "@include" does that fails within an "include" libpam leaves to chance, since it
    // then uses a control that was never set. The worst case counts here.
    if (facility) {
      Add(StackEntry::Kind::AlwaysFails, frame, *facility, line, origin);
    }
    return facility.has_value();
  }

  bool AddModule(const Frame& frame, Facility facility, const PolicyLine& line, const Origin& origin) {
    if (line.effect == Effect::WholeFails) {
      return false;
    }
    bool fails = line.effect == Effect::Fails;
    Add(fails ? StackEntry::Kind::AlwaysFails : StackEntry::Kind::Module, frame, facility, line, origin);
    return true;
  }

  void Add(StackEntry::Kind kind, const Frame& frame, Facility facility, const PolicyLine& line,
           const Origin& origin) {
    stacks_[static_cast<std::size_t>(facility)].push_back(
        {kind, frame.level, line.Control(), line.actions, line.target, line.arguments, line.quiet, origin});
  }

  /// Reads an included file; false when libpam cannot.
  bool Load(const Frame& frame, const PolicyLine& line, const Origin& origin) {
    if (frame.level >= substackLimit) {
      Report(origin, line.target, "substacks are nested more than 15 deep; libpam fails here", overwhelmed);
      return false;
    }
    if (std::find(frames_.begin(), frames_.end(), frame) != frames_.end()) {
      Report(origin, line.target, "the file includes itself, directly or by others; libpam crashes",
             overwhelmed);
      throw FatalPolicy();
    }
    if (frames_.size() > includeLimit) {
      Report(origin, line.target, "includes are nested more than 200 deep", overwhelmed);
      throw FatalPolicy();
    }
    FileReading reading = read_(frame.path);
    if (!reading.content || reading.problem) {
      ReportUnreadable(frame.path, reading, line, origin);
    }
    return reading.content && ParseContent(frame, *reading.content);
  }

  void ReportUnreadable(const std::string& path, const FileReading& reading, const PolicyLine& line,
                        const Origin& origin) {
    const std::string file = "the included file \"" + path + "\" ";
    if (!reading.problem) {
      Report(origin, line.target, file + "does not exist", "make the file, or correct or remove the line");
      return;
    }
    const ReadingProblem& problem = *reading.problem;
    const std::string place =
        problem.line > 0 ? " (line " + std::to_string(problem.line) + ": " + problem.value + ")" : "";
    Report(origin, line.target, file + "cannot be read: " + problem.reason + place, problem.remedy);
  }

  const FileReader& read_;
  std::vector<Finding>& findings_;
  Stacks& stacks_;
  std::vector<Frame> frames_;
  std::size_t lines_ = 0;
};

class ServiceResolver {
 public:
  ServiceResolver(const std::string& service, const FileReader& read) : read_(read) {
    policy_.service = Lower(service);
  }

  Policy Resolve() {
    try {
      policy_.state = ResolveBoth() ? Policy::State::Usable : Policy::State::Refused;
    } catch (const FatalPolicy&) {
      policy_.state = Policy::State::Fatal;
    }
    if (policy_.state != Policy::State::Usable) {
      policy_.stacks = {};
      policy_.fromOther = {};
    }
    return std::move(policy_);
  }

 private:
  struct Definition {
    std::string file;
    std::string content;
  };

  /// The first file of the service that can be opened counts.
  std::optional<Definition> Find(const std::string& service, std::vector<Finding>& findings) const {
    for (const char* folder : policyFolders) {
      std::string path = std::string(folder) + "/" + service;
      FileReading reading = read_(path);
      if (const std::optional<ReadingProblem>& problem = reading.problem) {
        findings.push_back({{path, problem->line},
                            problem->value,
                            "the file cannot be read: " + problem->reason,
                            problem->remedy});
      }
      if (reading.content) {
        return Definition{path, std::move(*reading.content)};
      }
    }
    return std::nullopt;
  }

  bool Parse(const std::optional<Definition>& definition, std::vector<Finding>& findings,
             Stacks& stacks) const {
    return !definition || FileResolver(read_, findings, stacks).Parse(definition->file, definition->content);
  }

  bool ResolveBoth() {
    std::optional<Definition> own = Find(policy_.service, policy_.findings);
    policy_.file = own ? own->file : "";
    if (!Parse(own, policy_.findings, policy_.stacks)) {
      return false;
    }
    // Deliberate: for "other" itself libpam reads the file twice, into the same stacks.
    bool isOther = policy_.service == otherService;
    Stacks otherStacks;
    std::optional<Definition> other = Find(otherService, otherFindings_);
    if (!own && !other) {
      policy_.findings.push_back({{std::string(policyFolders[0]) + "/" + policy_.service, 0},
                                  policy_.service,
                                  "there is no such service, and no service \"other\"",
                                  "make the file"});
      return false;
    }
    if (!ParseOther(other, isOther ? policy_.stacks : otherStacks)) {
      return false;
    }
    if (!isOther) {
      FillFrom(otherStacks);
    }
    return true;
  }

  /// What is wrong in "other" is this service's matter when it is used, or when it stops libpam.
  bool ParseOther(const std::optional<Definition>& other, Stacks& stacks) {
    try {
      bool usable = Parse(other, otherFindings_, stacks);
      if (!usable) {
        TakeOtherFindings();
      }
      return usable;
    } catch (const FatalPolicy&) {
      TakeOtherFindings();
      throw;
    }
  }

  void TakeOtherFindings() {
    for (Finding& finding : otherFindings_) {
      if (std::find(policy_.findings.begin(), policy_.findings.end(), finding) == policy_.findings.end()) {
        policy_.findings.push_back(std::move(finding));
      }
    }
    otherFindings_.clear();
  }

  void FillFrom(Stacks& other) {
    for (std::size_t index = 0; index < other.size(); ++index) {
      if (policy_.stacks[index].empty() && !other[index].empty()) {
        policy_.stacks[index] = std::move(other[index]);
        policy_.fromOther[index] = true;
      }
    }
    if (std::find(policy_.fromOther.begin(), policy_.fromOther.end(), true) != policy_.fromOther.end()) {
      TakeOtherFindings();
    }
  }

  const FileReader& read_;
  Policy policy_;
  std::vector<Finding> otherFindings_;
};

}  // namespace

std::string ModuleName(std::string_view module) {
  std::string_view name = module.substr(module.rfind('/') + 1);
  constexpr std::string_view suffix = ".so";
  return std::string(name.ends_with(suffix) ? name.substr(0, name.size() - suffix.size()) : name);
}

Policy ResolvePolicy(const std::string& service, const FileReader& read) {
  return ServiceResolver(service, read).Resolve();
}

}  // namespace velmorctl::pam
