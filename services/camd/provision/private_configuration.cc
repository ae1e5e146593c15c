#include "provision/private_configuration.h"

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string_view>

#include "common/status.h"
#include "common/unique_fd.h"

namespace camd {
namespace {

constexpr const char* kFolder = "/etc/samba";

[[noreturn]] void Fail(const std::string& action) {
  throw Failure(kInternalError, "cannot " + action + ": " + ErrorText(errno));
}

void WriteFile(const std::string& path, std::string_view content) {
  const UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600));
  if (!file.IsOpen() ||
      write(file.Get(), content.data(), content.size()) != static_cast<ssize_t>(content.size())) {
    Fail("write " + path);
  }
}

void BecomeRootOfOwnNamespace() {
  const std::string user = "0 " + std::to_string(geteuid()) + " 1";
  const std::string group = "0 " + std::to_string(getegid()) + " 1";
  if (unshare(CLONE_NEWUSER) != 0) Fail("make a user namespace");
  // A process without core files does not own its files in /proc.
  prctl(PR_SET_DUMPABLE, 1);
  WriteFile("/proc/self/setgroups", "deny");
  WriteFile("/proc/self/uid_map", user);
  WriteFile("/proc/self/gid_map", group);
  prctl(PR_SET_DUMPABLE, 0);
}

std::string ConfigurationFor(const std::string& netbiosDomain, const std::string& realm) {
  std::string text = "[global]\n\tsecurity = ADS\n\tworkgroup = " + netbiosDomain + "\n\trealm = " + realm +
                     "\n\tdisable netbios = yes\n\tload printers = no\n\tlog level = 0\n";
  for (const char* place : {"private dir", "lock directory", "state directory", "cache directory",
                            "pid directory", "ncalrpc dir", "binddns dir"}) {
    text += std::string("\t") + place + " = " + kFolder + "/state\n";
  }
  return text;
}

}  // namespace

void UsePrivateConfiguration(const std::string& netbiosDomain, const std::string& realm) {
  if (geteuid() != 0) BecomeRootOfOwnNamespace();
  if (unshare(CLONE_NEWNS) != 0) Fail("make a mount namespace");
  if (mount(nullptr, "/", nullptr, MS_REC | MS_SLAVE, nullptr) != 0) Fail("make the mounts private");
  if (mount("velmor-camd", kFolder, "tmpfs", MS_NOSUID | MS_NODEV | MS_NOEXEC, "mode=700,size=16m") != 0) {
    Fail(std::string("mount a folder in memory on ") + kFolder);
  }
  const std::string folder = kFolder;
  if (mkdir((folder + "/state").c_str(), 0700) != 0) Fail("make a folder in " + folder);
  WriteFile(folder + "/smb.conf", ConfigurationFor(netbiosDomain, realm));
}

}  // namespace camd
