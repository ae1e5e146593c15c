#include "common/smb_conf.h"

#include <sstream>

#include "common/files.h"
#include "common/names.h"
#include "common/paths.h"
#include "common/status.h"

namespace sambaprovider {
namespace {

bool IsWorkgroupLine(std::string_view line) {
  const size_t begin = line.find_first_not_of(" \t");
  constexpr std::string_view kKey = "workgroup";
  return begin != std::string_view::npos && line.substr(begin, kKey.size()) == kKey;
}

std::string WithoutWorkgroup(const std::string& text) {
  std::istringstream lines(text);
  std::string result;
  for (std::string line; std::getline(lines, line);) {
    if (!IsWorkgroupLine(line)) result += line + "\n";
  }
  return result;
}

std::string PasswordServers(const std::vector<std::string>& preferred) {
  std::string text = "  password server = ";
  for (const std::string& controller : preferred) text += controller + " ";
  // The asterisk lets winbindd find another one when these do not answer.
  return text + "*\n";
}

}  // namespace

std::string FormatSmbConf(const State& state, const Settings& settings, KeytabUse keytab) {
  std::ostringstream text;
  text.imbue(std::locale::classic());
  text << "# Written by velmor's samba provider when this host joined " << state.dnsDomain << ".\n"
       << "# Do not change it: the provider refuses to replace a file that differs from what it wrote.\n"
       << "[global]\n"
       << "  workgroup = " << state.netbiosDomain << "\n"
       << "  realm = " << UpperCase(state.dnsDomain) << "\n"
       << "  netbios name = " << state.hostName << "\n"
       << "  security = ADS\n"
       << "  server role = member server\n";
  if (!state.preferredDomainControllers.empty()) text << PasswordServers(state.preferredDomainControllers);
  if (keytab == KeytabUse::kKept) {
    text << "  kerberos method = secrets and keytab\n"
         << "  dedicated keytab file = " << paths::kKeytab << "\n";
  }
  text << "  winbind request timeout = " << settings.winbindRequestTimeout.count()
       << "\n"
       // winbindd would change the password and forget the keytab; the provider changes both together.
       << "  machine password timeout = 0\n"
       << "  winbind scan trusted domains = yes\n"
       << "  winbind use default domain = no\n"
       << "  winbind refresh tickets = yes\n"
       << "  idmap config * : backend = tdb\n"
       << "  idmap config * : range = 3000-7999\n"
       << "  idmap config " << state.netbiosDomain << " : backend = rid\n"
       << "  idmap config " << state.netbiosDomain << " : range = 10000-999999\n"
       << "  client ldap sasl wrapping = seal\n"
       << "  disable netbios = yes\n"
       << "  load printers = no\n";
  return text.str();
}

SmbConfOwner OwnerOfSmbConf(const std::optional<std::string>& present,
                            const std::optional<std::string>& written,
                            const std::optional<std::string>& distribution) {
  if (!present) return SmbConfOwner::kNobody;
  if (written && *written == *present) return SmbConfOwner::kProvider;
  if (distribution && WithoutWorkgroup(*distribution) == WithoutWorkgroup(*present)) {
    return SmbConfOwner::kDistribution;
  }
  return SmbConfOwner::kAdministrator;
}

SmbConfOwner OwnerOfPresentSmbConf() {
  // Whoever made a link wants the file elsewhere, where others may use it too.
  if (IsLink(paths::kSmbConf)) return SmbConfOwner::kAdministrator;
  const auto present = ReadFile(paths::kSmbConf);
  // A kill may have come between the new file and the note that it is the last one.
  if (present && present == ReadFile(paths::kNextSmbConf)) return SmbConfOwner::kProvider;
  return OwnerOfSmbConf(present, ReadFile(paths::kWrittenSmbConf), ReadFile(paths::kDistributionSmbConf));
}

void RequireSmbConfIsReplaceable() {
  if (OwnerOfPresentSmbConf() != SmbConfOwner::kAdministrator) return;
  throw Failure(kHostConfigurationInTheWay, std::string(paths::kSmbConf) +
                                                " is a link, or neither the provider's nor the "
                                                "distribution's untouched one, so it is not replaced; "
                                                "move it away or restore " +
                                                paths::kDistributionSmbConf);
}

void WriteSmbConf(const std::string& text) {
  ReplaceFile(paths::kNextSmbConf, text, 0644);
  ReplaceFile(paths::kSmbConf, text, 0644);
  ReplaceFile(paths::kWrittenSmbConf, text, 0644);
  RemoveFile(paths::kNextSmbConf);
}

void ForgetWrittenSmbConf() {
  RemoveFile(paths::kWrittenSmbConf);
  RemoveFile(paths::kNextSmbConf);
}

}  // namespace sambaprovider
