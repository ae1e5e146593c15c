#include "prepared_host.h"

#include <algorithm>
#include <sstream>

namespace velmorctltest {

namespace {

const std::string SCRIPT_FOLDER = "/run/script/";

}  // namespace

PreparedHost::PreparedHost() {
  testsupport::MakeFolders(SCRIPT_FOLDER);
  testsupport::CopyFile(VELMORCTL_SCRIPTED_PROVIDER, testsupport::PLUGIN_FOLDER + "libctlscript.so");
  testsupport::WriteFile(testsupport::PROVIDER_CONF, "provider = \"ctlscript\"\n");
  testsupport::WriteFile(testsupport::AUTHENTICATION_CONF, "remote-authentication-store = \"None\"\n");
  testsupport::WriteFile(PASSWORD_FILE, PASSWORD + "\n");
  testsupport::SetMode(PASSWORD_FILE, 0600);
}

void PreparedHost::Script(const std::string& name, const std::string& content) {
  testsupport::WriteFile(SCRIPT_FOLDER + name, content);
}

void PreparedHost::RemoveScript(const std::string& name) {
  testsupport::RemoveFile(SCRIPT_FOLDER + name);
}

std::vector<std::string> PreparedHost::Calls() {
  std::vector<std::string> calls;
  if (testsupport::Exists(SCRIPT_FOLDER + "calls")) {
    std::istringstream stream(testsupport::ReadFile(SCRIPT_FOLDER + "calls"));
    for (std::string line; std::getline(stream, line);) {
      calls.push_back(line);
    }
  }
  return calls;
}

bool PreparedHost::Called(const std::string& call) {
  const std::vector<std::string> calls = Calls();
  return std::find(calls.begin(), calls.end(), call) != calls.end();
}

void PreparedHost::MakeJoined() {
  const Outcome outcome = Velmorctl(Join("corp.example/Servers"));
  if (outcome.exitCode != 0) {
    throw std::runtime_error("cannot join: " + outcome.errors);
  }
}

std::vector<std::string> PreparedHost::Join(const std::string& target) {
  return {"join", target, "-U", "alice", "--password-file", PASSWORD_FILE, "--skip-hostname-check"};
}

bool PreparedHost::JoinedAtProvider() {
  return testsupport::Exists(SCRIPT_FOLDER + "domain");
}

std::string PreparedHost::ActiveStore() {
  const std::string output = Velmorctl({"store", "show"}).output;
  return output.substr(0, output.find('\n'));
}

}  // namespace velmorctltest
