#include "helper/keytab.h"

#include <sys/stat.h>

#include <fcntl.h>
#include <algorithm>
#include <chrono>
#include <optional>
#include <sstream>

#include "common/child.h"
#include "common/files.h"
#include "common/paths.h"
#include "common/state.h"
#include "common/status.h"
#include "helper/machine_password.h"
#include "helper/operations.h"

namespace sambaprovider {
namespace {

constexpr const char* kNet = "/usr/bin/net";
constexpr std::chrono::seconds kLimit{30};
// As long as winbindd would wait, were it allowed to change the password by itself.
constexpr std::chrono::hours kLongestPasswordAge{7 * 24};

std::string RunNet(const std::vector<std::string>& arguments) {
  std::vector<std::string> command = {kNet, "ads", "--machine-pass"};
  command.insert(command.end(), arguments.begin(), arguments.end());
  const ProgramResult result = RunProgram(command, ProgramOutput::kWanted, kLimit);
  if (result.exitStatus == 0) return result.output;
  throw Failure(kInternalError, "net ads " + arguments.front() + " failed: " +
                                    (result.timedOut ? "no answer in time" : LastLine(result.output)));
}

std::optional<int64_t> KeytabTime() {
  struct stat keytab = {};
  if (stat(paths::kKeytab, &keytab) != 0) return std::nullopt;
  return keytab.st_mtim.tv_sec;
}

// Notes that the keytab was looked at, so that the plug-in does not ask again at once.
void TouchKeytab() {
  utimensat(AT_FDCWD, paths::kKeytab, nullptr, 0);
}

void RefreshKeytab(const Call& call, int64_t passwordTime) {
  const auto keytabTime = KeytabTime();
  const auto age = std::chrono::seconds(time(nullptr) - passwordTime);
  if (!keytabTime || passwordTime >= *keytabTime) {
    call.log.Run("keytab", "the machine's password is newer than the keytab: making it anew", [] {
      MakeKeytab("");
      return "made";
    });
  } else if (passwordTime != 0 && age > kLongestPasswordAge) {
    call.log.Run("keytab", "the machine's password is a week old: changing it and the keytab", [] {
      RunNet({"changetrustpw"});
      return "changed";
    });
  } else {
    TouchKeytab();
  }
}

}  // namespace

void MakeKeytab(const std::string& controller) {
  std::vector<std::string> arguments = {"keytab", "create"};
  if (!controller.empty()) arguments.push_back("--server=" + controller);
  RunNet(arguments);
}

std::string FindMachineAccountDn(const std::string& computer) {
  constexpr std::string_view kAttribute = "distinguishedName: ";
  std::istringstream lines(RunNet({"search", "(sAMAccountName=" + computer + "$)", "distinguishedName"}));
  for (std::string line; std::getline(lines, line);) {
    if (line.compare(0, kAttribute.size(), kAttribute) == 0) return line.substr(kAttribute.size());
  }
  throw Failure(kInternalError, "the directory has no account " + computer + "$");
}

std::string Refresh(const Call& call) {
  State state = LoadState();
  if (!state.joined) return "the host has joined no domain";
  RefreshKeytab(call, MachinePasswordTime(state.netbiosDomain).value_or(0));
  call.log.Run("account", "asking for the machine account's name", [&] {
    state.machineAccountDn = FindMachineAccountDn(state.hostName);
    SaveState(state);
    return state.machineAccountDn;
  });
  return "keytab and account name are up to date";
}

}  // namespace sambaprovider
