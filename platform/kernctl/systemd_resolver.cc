#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include "hostmgmt/replace_file.h"
#include "kernctl/resolver_configuration.h"
#include "system/make_directory.h"
#include "system/read_file.h"
#include "system/run_program.h"
#include "system/system_error.h"
#include "system/text_lines.h"

namespace KernCtl::Network {
namespace {

using HostMgmt::System::TextLines;

constexpr char kMainPath[] = "/etc/systemd/resolved.conf";
constexpr char kDropInDirectory[] = "/etc/systemd/resolved.conf.d";
constexpr char kOwnPath[] = "/etc/systemd/resolved.conf.d/50-quenix-search-domains.conf";

/// What follows "Domains=" on a line; an empty view with a null pointer for any other line.
std::string_view DomainsValue(const std::string& text) {
  constexpr std::string_view kKey = "Domains";
  const std::size_t start = text.find_first_not_of(" \t");
  if (start == std::string::npos || text.compare(start, kKey.size(), kKey) != 0) return {};
  const std::size_t equals = text.find_first_not_of(" \t", start + kKey.size());
  if (equals == std::string::npos || text[equals] != '=') return {};
  return std::string_view(text).substr(equals + 1);
}

/// Adds up the file's settings as the service does: each adds to those before, and an empty one drops them.
void ReadDomains(const std::string& path, DomainList* domains) {
  const TextLines lines = HostMgmt::System::SplitLines(HostMgmt::System::ReadFile(path).value_or(""));
  for (const HostMgmt::System::TextLine& line : lines) {
    const std::string_view value = DomainsValue(line.text);
    if (value.data() == nullptr) continue;
    const DomainList words = HostMgmt::System::SplitWords(value);
    if (words.empty()) domains->clear();
    domains->insert(domains->end(), words.begin(), words.end());
  }
}

/// The administrator's files beside the main one, in the order in which the service reads them.
std::vector<std::string> DropInPaths() {
  std::vector<std::string> paths;
  std::error_code error;
  for (std::filesystem::directory_iterator entry(kDropInDirectory, error), end; !error && entry != end;
       entry.increment(error)) {
    if (entry->path().extension() == ".conf") paths.push_back(entry->path().string());
  }
  if (error && error.value() != ENOENT) {
    HostMgmt::System::ThrowFileError("read", kDropInDirectory, error.value());
  }
  std::sort(paths.begin(), paths.end());
  return paths;
}

void MakeDropInDirectory() {
  if (!HostMgmt::System::MakeDirectory(kDropInDirectory)) {
    HostMgmt::System::ThrowFileError("create", kDropInDirectory, errno);
  }
}

/// The configuration of systemd-resolved. Ours is a file of its own beside the administrator's.
class SystemdResolver : public ResolverConfiguration {
 public:
  DomainList GetSearchDomains() const override {
    DomainList domains;
    ReadDomains(kMainPath, &domains);
    for (const std::string& path : DropInPaths()) ReadDomains(path, &domains);
    return domains;
  }

  void AddSearchDomains(const DomainList& domains) override {
    DomainList own;
    ReadDomains(kOwnPath, &own);
    // What stands there already and is not in force was dropped by a file behind it, again and again.
    const DomainList missing = MissingDomains(domains, own);
    if (missing.empty()) return;
    own.insert(own.end(), missing.begin(), missing.end());
    MakeDropInDirectory();
    HostMgmt::ReplaceFile(kOwnPath,
                          "# The DNS search domains that this host was given.\n[Resolve]\nDomains=" +
                              HostMgmt::System::JoinWords(own) + "\n");
  }

  /// The service is asked through its unit, which starts nothing that does not run.
  void Apply() override {
    if (access("/run/systemd/system", F_OK) != 0) return;
    HostMgmt::System::RunProgram(
        {"/usr/bin/systemctl", "--no-ask-password", "try-reload-or-restart", "systemd-resolved.service"});
  }
};

}  // namespace

std::unique_ptr<ResolverConfiguration> MakeSystemdResolver() {
  return std::make_unique<SystemdResolver>();
}

}  // namespace KernCtl::Network
