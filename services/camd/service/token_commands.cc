#include "service/token_commands.h"

#include <grp.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <ctime>

#include "common/status.h"
#include "service/configuration.h"
#include "service/token_store.h"

namespace camd {
namespace {

// SQLite makes files beside the ledger; they must belong to the service's user.
void BecomeOwnerOfFolder(const std::string& file) {
  struct stat status = {};
  const std::string folder = file.substr(0, file.rfind('/') + 1);
  if (stat(folder.c_str(), &status) != 0) {
    throw ConfigurationError("cannot look at " + folder + ": " + ErrorText(errno));
  }
  if (geteuid() != 0 || status.st_uid == 0) return;
  if (setgroups(0, nullptr) != 0 || setgid(status.st_gid) != 0 || setuid(status.st_uid) != 0) {
    throw ConfigurationError("cannot become the owner of " + folder + ": " + ErrorText(errno));
  }
}

TokenStore OpenStore(const std::string& path) {
  const std::string file = ReadConfiguration(path).server.ledgerFile;
  BecomeOwnerOfFolder(file);
  return TokenStore(file);
}

std::string TimeText(int64_t seconds) {
  if (seconds == 0) return "-";
  const time_t moment = seconds;
  tm parts = {};
  gmtime_r(&moment, &parts);
  std::array<char, 32> text = {};
  strftime(text.data(), text.size(), "%Y-%m-%dT%H:%M:%SZ", &parts);
  return text.data();
}

const char* TextOr(const std::string& text, const char* other) {
  return text.empty() ? other : text.c_str();
}

}  // namespace

void AddToken(const std::string& path, const std::string& hostName, std::chrono::hours lifetime) {
  TokenStore store = OpenStore(path);
  const int64_t now = time(nullptr);
  const Secret token = store.Add(hostName, now, now + std::chrono::seconds(lifetime).count());
  std::printf("%s\n", token.Text());
}

void ListTokens(const std::string& path) {
  TokenStore store = OpenStore(path);
  std::printf("%-16s  %-20s  %-20s  %-20s  %s\n", "TOKEN", "EXPIRES", "USED", "FOR", "USED BY");
  for (const Token& token : store.List()) {
    std::printf("%-16s  %-20s  %-20s  %-20s  %s\n", token.id.c_str(), TimeText(token.expires).c_str(),
                TimeText(token.used).c_str(), TextOr(token.hostName, "any"), TextOr(token.usedBy, "-"));
  }
}

bool RemoveToken(const std::string& path, const std::string& id) {
  return OpenStore(path).Remove(id);
}

}  // namespace camd
