#include "pam_edit/profile_tool.h"

#include "failure.h"
#include "pam_edit/scratch_folder.h"
#include "text.h"
#include "velmor/run_program.h"

namespace velmorctl::pam {

namespace {

constexpr char program[] = "/usr/sbin/pam-auth-update";
constexpr char databaseFile[] = "/debconf.conf";
constexpr char outputFile[] = "/output";
constexpr char copyFolder[] = "/root";

/// The settings of debconf, through which the program asks its questions: databases of this run alone.
std::string DatabaseSettings(const std::string& folder) {
  std::string settings = "Config: answers\nTemplates: templates\n";
  for (const char* name : {"answers", "templates"}) {
    settings += "\nName: " + std::string(name) + "\nDriver: File\nMode: 600\nFilename: " + folder + "/" +
                name + ".dat\n";
  }
  return settings;
}

std::vector<std::string> Environment(const std::string& folder) {
  return {"PATH=/usr/sbin:/usr/bin:/sbin:/bin",
          "LC_ALL=C",
          "HOME=" + folder,
          "DEBIAN_FRONTEND=noninteractive",
          "DEBCONF_NOWARNINGS=yes",
          "DEBCONF_SYSTEMRC=" + folder + databaseFile};
}

/// The last line that the program wrote.
std::string LastWords(const ScratchFolder& scratch) {
  std::string output = scratch.Read(outputFile);
  std::size_t end = output.find_last_not_of(" \t\n");
  if (end == std::string::npos) {
    return {};
  }
  std::size_t begin = output.find_last_of('\n', end);
  return output.substr(begin + 1, end - begin);
}

void Run(const ScratchFolder& scratch, const std::vector<std::string>& arguments) {
  std::vector<std::string> command = {program, "--root", scratch.Path() + copyFolder};
  command.insert(command.end(), arguments.begin(), arguments.end());
  const velmor::ProgramEnd end = velmor::RunProgram({.arguments = command,
                                                     .environment = Environment(scratch.Path()),
                                                     .output = scratch.Path() + outputFile,
                                                     .longestRun = std::chrono::minutes(1)});
  if (end.startError != 0) {
    throw Failure(ExitCode::HostNotReady, "the files are kept by pam-auth-update, which cannot be run")
        .Detail("file", program)
        .Detail("reason", SystemErrorText(end.startError))
        .Try("install the package libpam-runtime, or keep the files by hand");
  }
  if (!end.failure.empty()) {
    std::string words = LastWords(scratch);
    throw Failure(ExitCode::HostNotReady, "pam-auth-update cannot change the files")
        .Detail("reason", words.empty() ? end.failure : end.failure + ": " + Printable(words))
        .Try("see what \"pam-auth-update\" says when it is run by hand");
  }
}

std::vector<std::string> Paths(const std::string& before, const std::vector<std::string>& names) {
  std::vector<std::string> paths;
  for (const std::string& name : names) {
    paths.push_back(before + name);
  }
  return paths;
}

}  // namespace

const std::vector<std::string>& ProfileTargets() {
  static const std::vector<std::string> targets =
      Paths("/etc/pam.d/common-", {"auth", "account", "password", "session", "session-noninteractive"});
  return targets;
}

const std::vector<std::string>& ProfileRecords() {
  static const std::vector<std::string> records =
      Paths(profileStateFolder + std::string("/"),
            {"auth", "account", "password", "session", "session-noninteractive", "seen"});
  return records;
}

FileContents TryProfileTool(const FileContents& files, const std::vector<std::string>& arguments) {
  ScratchFolder scratch;
  scratch.Write(databaseFile, DatabaseSettings(scratch.Path()));
  for (const auto& [name, content] : files) {
    scratch.Write(copyFolder + name, content);
  }
  Run(scratch, arguments);
  FileContents after;
  for (const std::vector<std::string>* names : {&ProfileTargets(), &ProfileRecords()}) {
    for (const std::string& name : *names) {
      after[name] = scratch.Read(copyFolder + name);
    }
  }
  return after;
}

}  // namespace velmorctl::pam
