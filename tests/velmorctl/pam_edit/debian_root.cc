#include "velmorctl/pam_edit/debian_root.h"

#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <stdexcept>
#include <system_error>

namespace velmorctltest {

namespace {

namespace fs = std::filesystem;

const std::string PROFILE_TOOL = "/usr/sbin/pam-auth-update";
const std::string REAL_PROFILE_TOOL = "/run/real-pam-auth-update";
const std::string STAND_IN = "/run/pam-auth-update";

void Check(bool done, const std::string& what) {
  if (!done) {
    throw std::system_error(errno, std::generic_category(), what);
  }
}

/// Runs the program with this environment only.
void Run(const std::vector<std::string>& command, const std::vector<std::string>& environment) {
  const pid_t child = fork();
  Check(child >= 0, "fork");
  if (child == 0) {
    std::vector<char*> arguments;
    std::vector<char*> variables;
    for (const std::string& argument : command) {
      arguments.push_back(const_cast<char*>(argument.c_str()));
    }
    for (const std::string& variable : environment) {
      variables.push_back(const_cast<char*>(variable.c_str()));
    }
    arguments.push_back(nullptr);
    variables.push_back(nullptr);
    execve(arguments[0], arguments.data(), variables.data());
    _exit(126);
  }
  int status = 0;
  while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
  }
  if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
    throw std::runtime_error(command[0] + " failed");
  }
}

void CopyFiles(const fs::path& from, const fs::path& to) {
  if (!fs::exists(from)) {
    return;
  }
  fs::create_directories(to);
  for (const fs::directory_entry& entry : fs::directory_iterator(from)) {
    fs::copy_file(entry.path(), to / entry.path().filename(), fs::copy_options::overwrite_existing);
  }
}

/// Packages whose profiles a host without a directory does not have.
const std::vector<std::string> OTHER_PROFILES = {"libpam-winbind", "libpam-sss", "libpam-pwquality"};

void CopyProfiles(const fs::path& package, const fs::path& root) {
  CopyFiles(package / "usr/share/pam-configs", root / "usr/share/pam-configs");
}

std::string Describe(const fs::path& path) {
  struct stat status {};
  Check(lstat(path.c_str(), &status) == 0, path);
  const std::string attributes = std::to_string(status.st_mode) + " " + std::to_string(status.st_uid) + ":" +
                                 std::to_string(status.st_gid) + " ";
  if (S_ISLNK(status.st_mode)) {
    return attributes + "-> " + fs::read_symlink(path).string();
  }
  return S_ISREG(status.st_mode) ? attributes + testsupport::ReadFile(path) : attributes;
}

}  // namespace

HostRoot::HostRoot() : path_(scratch_.Path() + "host") {
  Write("/etc/quenix/velmor/provider.conf", "provider = \"ctlscript\"\n");
  Write("/etc/passwd", "root:x:0:0:root:/root:/bin/bash\nlocal:x:1500:1500::/home/local:/bin/bash\n");
  Write("/etc/pam.d/other",
        "auth required pam_deny.so\naccount required pam_deny.so\npassword required pam_deny.so\n"
        "session required pam_permit.so\n");
}

void HostRoot::Write(const std::string& name, const std::string& content) const {
  testsupport::MakeFolders(fs::path(path_ + name).parent_path());
  testsupport::WriteFile(path_ + name, content);
}

std::string HostRoot::Read(const std::string& name) const {
  return testsupport::ReadFile(path_ + name);
}

Tree HostRoot::Files() const {
  Tree tree;
  for (const fs::directory_entry& entry : fs::recursive_directory_iterator(path_)) {
    const std::string name = entry.path().string().substr(path_.size());
    if (!name.starts_with("/var/lib/quenix") && !fs::is_directory(entry.symlink_status())) {
      tree[name] = Describe(entry.path());
    }
  }
  return tree;
}

Outcome HostRoot::Pam(std::vector<std::string> arguments) const {
  arguments.insert(arguments.begin(), "pam");
  arguments.insert(arguments.end(), {"--root", path_});
  return Velmorctl(arguments);
}

bool HostRoot::LetsIn(const std::string& service, const std::string& user, const std::string& directory,
                      const std::vector<std::string>& answers) const {
  std::vector<std::string> arguments = {"simulate", service, "--user", user, "--directory", directory};
  for (const std::string& answer : answers) {
    arguments.insert(arguments.end(), {"--answer", answer});
  }
  const Outcome outcome = Pam(arguments);
  if (outcome.exitCode != 0 && outcome.exitCode != 13) {
    throw std::runtime_error("cannot simulate: " + outcome.errors);
  }
  return outcome.exitCode == 0;
}

DebianRoot::DebianRoot() {
  for (const fs::directory_entry& package : fs::directory_iterator(DEBIAN_POLICIES)) {
    CopyFiles(package.path() / "etc/pam.d", Path() + "/etc/pam.d");
    CopyFiles(package.path() / "usr/lib/pam.d", Path() + "/usr/lib/pam.d");
    const std::string name = package.path().filename();
    if (std::find(OTHER_PROFILES.begin(), OTHER_PROFILES.end(), name) == OTHER_PROFILES.end()) {
      CopyProfiles(package.path(), Path());
    }
  }
  testsupport::MakeFolders(Path() + "/var/lib/pam");
  UpdateProfiles({"--package", "--force"});
}

void DebianRoot::AddOtherProfiles() const {
  for (const std::string& package : OTHER_PROFILES) {
    CopyProfiles(fs::path(DEBIAN_POLICIES) / package, Path());
  }
  UpdateProfiles({"--package"});
}

void DebianRoot::UpdateProfiles(const std::vector<std::string>& arguments) const {
  const testsupport::ScratchFolder databases;
  std::string settings = "Config: answers\nTemplates: templates\n";
  for (const std::string name : {"answers", "templates"}) {
    settings += "\nName: " + name + "\nDriver: File\nFilename: " + databases.Path() + name + "\n";
  }
  testsupport::WriteFile(databases.Path() + "debconf.conf", settings);
  std::vector<std::string> command = {PROFILE_TOOL, "--root", Path()};
  command.insert(command.end(), arguments.begin(), arguments.end());
  Run(command, {"PATH=/usr/sbin:/usr/bin:/sbin:/bin", "DEBIAN_FRONTEND=noninteractive",
                "DEBCONF_SYSTEMRC=" + databases.Path() + "debconf.conf"});
}

std::vector<std::string> DebianRoot::Services() const {
  std::vector<std::string> services = testsupport::NamesIn(Path() + "/etc/pam.d");
  const std::vector<std::string> vendor = testsupport::NamesIn(Path() + "/usr/lib/pam.d");
  services.insert(services.end(), vendor.begin(), vendor.end());
  return services;
}

std::string DirectoryAnswers(const std::string& facility, const std::string& answer) {
  return facility + ":" + DIRECTORY_MODULE + "=" + answer;
}

StandInForProfileTool::StandInForProfileTool(const std::string& script) {
  testsupport::CopyFile(PROFILE_TOOL, REAL_PROFILE_TOOL);
  testsupport::SetMode(REAL_PROFILE_TOOL, 0755);
  testsupport::WriteFile(STAND_IN, "#!/bin/sh\nREAL=" + REAL_PROFILE_TOOL + "\n" + script);
  testsupport::SetMode(STAND_IN, 0755);
  Check(mount(STAND_IN.c_str(), PROFILE_TOOL.c_str(), nullptr, MS_BIND, nullptr) == 0, PROFILE_TOOL);
}

StandInForProfileTool::~StandInForProfileTool() {
  umount2(PROFILE_TOOL.c_str(), MNT_DETACH);
}

}  // namespace velmorctltest
