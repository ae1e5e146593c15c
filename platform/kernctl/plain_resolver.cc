#include "hostmgmt/replace_file.h"
#include "kernctl/resolver_configuration.h"
#include "system/read_file.h"
#include "system/text_lines.h"

namespace KernCtl::Network {
namespace {

HostMgmt::System::TextLines ReadLines() {
  return HostMgmt::System::SplitLines(HostMgmt::System::ReadFile(kResolvConfPath).value_or(""));
}

/// /etc/resolv.conf itself, which the resolver reads without being told.
class PlainResolver : public ResolverConfiguration {
 public:
  DomainList GetSearchDomains() const override {
    const HostMgmt::System::TextLines lines = ReadLines();
    return SetsSearchList(lines) ? SearchListOf(lines) : ImplicitSearchList();
  }

  void AddSearchDomains(const DomainList& domains) override {
    HostMgmt::System::TextLines lines = ReadLines();
    // A search list would end the search in the host's own domain, so it takes that domain over.
    DomainList added = SetsSearchList(lines) ? DomainList() : ImplicitSearchList();
    added.insert(added.end(), domains.begin(), domains.end());
    AppendToSearchList(&lines, added);
    HostMgmt::ReplaceFile(kResolvConfPath, HostMgmt::System::JoinLines(lines));
  }

  void Apply() override {}
};

}  // namespace

std::unique_ptr<ResolverConfiguration> MakePlainResolver() {
  return std::make_unique<PlainResolver>();
}

}  // namespace KernCtl::Network
