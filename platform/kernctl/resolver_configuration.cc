#include "kernctl/resolver_configuration.h"

#include <unistd.h>

#include <string>
#include <string_view>

#include "system/read_file.h"
#include "system/resolve_links.h"

namespace KernCtl::Network {
namespace {

bool StartsWith(const std::string& text, std::string_view start) {
  return text.compare(0, start.size(), start) == 0;
}

}  // namespace

std::unique_ptr<ResolverConfiguration> OpenResolverConfiguration() {
  const std::string target = HostMgmt::System::LinkTarget(kResolvConfPath);
  if (StartsWith(target, "/run/systemd/resolve/") || target == "/usr/lib/systemd/resolv.conf") {
    return MakeSystemdResolver();
  }
  if (StartsWith(target, "/run/resolvconf/") || StartsWith(target, "/etc/resolvconf/run/")) {
    return MakeResolvconfResolver();
  }
  return MakePlainResolver();
}

DomainList SearchListInForce() {
  return SearchListOf(HostMgmt::System::SplitLines(HostMgmt::System::ReadFile(kResolvConfPath).value_or("")));
}

DomainList ImplicitSearchList() {
  char name[256];
  if (gethostname(name, sizeof(name)) != 0) return {};
  name[sizeof(name) - 1] = '\0';
  const std::string_view hostName(name);
  const std::size_t dot = hostName.find('.');
  if (dot == std::string_view::npos || dot + 1 == hostName.size()) return {};
  return {std::string(hostName.substr(dot + 1))};
}

}  // namespace KernCtl::Network
