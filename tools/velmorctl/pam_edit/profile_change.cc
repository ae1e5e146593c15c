#include "pam_edit/profile_change.h"

#include <algorithm>
#include <filesystem>
#include <sstream>
#include <system_error>

#include "failure.h"
#include "pam/policy_line.h"
#include "pam/stack.h"
#include "pam_edit/profile.h"
#include "pam_edit/profile_tool.h"

namespace velmorctl::pam {

namespace {

const std::string& ProfileFile() {
  static const std::string file = std::string(profileFolder) + "/" + profileName;
  return file;
}

struct RecordedLine {
  std::string profile;
  std::string module;
};

/// What pam-auth-update has written last, by its record: lines under the names of their profiles.
std::vector<RecordedLine> RecordedLines(const Draft& draft) {
  constexpr std::string_view heading = "Module: ";
  std::vector<RecordedLine> recorded;
  for (const std::string& record : ProfileRecords()) {
    std::istringstream stream(draft.Content(record).value_or(""));
    std::string profile;
    for (std::string line; std::getline(stream, line);) {
      if (line.starts_with(heading)) {
        profile = line.substr(heading.size());
      } else if (!profile.empty()) {
        // A record leaves the facility out.
        recorded.push_back({profile, ReadPolicyLine("auth " + line).target});
      }
    }
  }
  return recorded;
}

bool IsRecorded(const Draft& draft) {
  return !ModulesOfProfile(draft).empty();
}

/// Whether pam-auth-update reads the file as a profile.
bool IsProfileName(const std::string& name) {
  return !name.ends_with('~') && !(name.starts_with('#') && name.ends_with('#'));
}

void ReadProfiles(const Draft& draft, FileContents& files) {
  std::error_code error;
  std::filesystem::directory_iterator folder(draft.Root().Resolve(profileFolder), error);
  for (const std::filesystem::directory_entry& entry : folder) {
    std::string name = entry.path().filename();
    if (IsProfileName(name)) {
      std::string file = std::string(profileFolder) + "/" + name;
      files[file] = draft.RequiredContent(file);
    }
  }
  if (std::optional<std::string> own = draft.Content(ProfileFile())) {
    files[ProfileFile()] = *own;
  } else {
    files.erase(ProfileFile());
  }
}

/// What pam-auth-update works on. Nothing can be done without its files and its record of them.
FileContents ProfileFiles(const Draft& draft) {
  FileContents files;
  ReadProfiles(draft, files);
  for (const std::vector<std::string>* names : {&ProfileTargets(), &ProfileRecords()}) {
    for (const std::string& name : *names) {
      files[name] = draft.RequiredContent(name);
    }
  }
  return files;
}

void TakeOver(Draft& draft, const FileContents& after, const std::vector<std::string>& names) {
  for (const std::string& name : names) {
    draft.Write(name, after.at(name));
  }
}

[[noreturn]] void ThrowLeftAlone() {
  throw Failure(ExitCode::HostNotReady, "pam-auth-update leaves the common-* files as they are")
      .Detail("reason", "lines between its marks were changed by hand, or are not in its record")
      .Try("undo these changes, or see what \"pam-auth-update --force\" would make of the files");
}

}  // namespace

bool IsKeptByProfiles(const Draft& draft, const std::string& name) {
  bool isTarget = std::any_of(ProfileTargets().begin(), ProfileTargets().end(),
                              [&](const std::string& target) { return draft.SameFile(target, name); });
  return isTarget &&
         draft.Content(name).value_or("").find("\n# end of pam-auth-update config") != std::string::npos;
}

// Whatever is interrupted half way, a line is never in the files and missing in the record: pam-auth-update
// would take it for a change by hand.

void AddProfile(Draft& draft, const DirectoryModule& module) {
  draft.Write(ProfileFile(), ProfileText(module));
  FileContents after = TryProfileTool(ProfileFiles(draft), {"--enable", profileName});
  TakeOver(draft, after, ProfileRecords());
  TakeOver(draft, after, ProfileTargets());
  if (!IsRecorded(draft)) {
    ThrowLeftAlone();
  }
}

void RemoveProfile(Draft& draft) {
  if (IsRecorded(draft)) {
    FileContents after = TryProfileTool(ProfileFiles(draft), {"--remove", profileName});
    TakeOver(draft, after, ProfileTargets());
    TakeOver(draft, after, ProfileRecords());
    if (IsRecorded(draft)) {
      ThrowLeftAlone();
    }
  }
  if (draft.Content(ProfileFile())) {
    draft.Remove(ProfileFile());
  }
}

OwnModules ModulesOfProfile(const Draft& draft) {
  OwnModules modules;
  for (const RecordedLine& line : RecordedLines(draft)) {
    if (line.profile == profileName) {
      modules.insert(line.module);
    }
  }
  return modules;
}

std::string ProfileWithModule(const Draft& draft, const std::string& module) {
  for (const RecordedLine& line : RecordedLines(draft)) {
    if (ModuleName(line.module) == ModuleName(module)) {
      return line.profile;
    }
  }
  return {};
}

}  // namespace velmorctl::pam
