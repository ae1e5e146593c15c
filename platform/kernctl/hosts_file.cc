#include "kernctl/hosts_file.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>

#include "hostmgmt/host_management_exception.h"
#include "hostmgmt/replace_file.h"
#include "kernctl/hosts_lines.h"
#include "system/edit_lock.h"
#include "system/read_file.h"
#include "system/text_lines.h"

namespace KernCtl::Network {
namespace {

constexpr char kPath[] = "/etc/hosts";

HostMgmt::System::TextLines ReadLines() {
  return HostMgmt::System::SplitLines(HostMgmt::System::ReadFile(kPath).value_or(""));
}

bool IsAddress(const std::string& text) {
  in6_addr parsed{};
  return text.find('\0') == std::string::npos &&
         (inet_pton(AF_INET, text.c_str(), &parsed) == 1 || inet_pton(AF_INET6, text.c_str(), &parsed) == 1);
}

bool IsName(const std::string& text) {
  return !text.empty() && std::all_of(text.begin(), text.end(), [](char character) {
    const auto code = static_cast<unsigned char>(character);
    return code > 0x20 && code != 0x7f && character != '#';
  });
}

void RequireEntry(const HostsEntry& entry) {
  if (!IsAddress(entry.address)) {
    throw HostMgmt::Lib::HostMgmtException("'" + entry.address + "' is not an IP address");
  }
  for (const std::string& name : entry.names) {
    if (!IsName(name)) {
      throw HostMgmt::Lib::HostMgmtException("'" + name + "' cannot be a host name in '" + kPath + "'");
    }
  }
}

}  // namespace

HostsFile::HostsFile() {
  ReadLines();
}

void HostsFile::AddOrReplaceEntry(const std::string& address, const std::string& canonicalName,
                                  const std::vector<std::string>& aliases) {
  HostsEntry entry{address, {canonicalName}};
  entry.names.insert(entry.names.end(), aliases.begin(), aliases.end());
  RequireEntry(entry);
  const HostMgmt::System::EditLock lock("hosts", kPath);
  HostMgmt::System::TextLines lines = ReadLines();
  if (PutEntry(&lines, entry)) HostMgmt::ReplaceFile(kPath, HostMgmt::System::JoinLines(lines));
}

}  // namespace KernCtl::Network
