#include <string>

#include "hostmgmt/replace_file.h"
#include "kernctl/resolver_configuration.h"
#include "system/read_file.h"
#include "system/run_program.h"
#include "system/text_lines.h"

namespace KernCtl::Network {
namespace {

using HostMgmt::System::TextLines;

constexpr char kBasePath[] = "/etc/resolvconf/resolv.conf.d/base";
constexpr char kTailPath[] = "/etc/resolvconf/resolv.conf.d/tail";

TextLines ReadLines(const char* path) {
  return HostMgmt::System::SplitLines(HostMgmt::System::ReadFile(path).value_or(""));
}

/// The file that decides about the search list. resolvconf gathers the domains of its interfaces and of its
/// base file into one line, and copies the tail file behind that, where a `search` line overrules it.
const char* DecidingFile() {
  return SetsSearchList(ReadLines(kTailPath)) ? kTailPath : kBasePath;
}

/// The configuration from which resolvconf makes /etc/resolv.conf.
class ResolvconfResolver : public ResolverConfiguration {
 public:
  DomainList GetSearchDomains() const override { return SearchListOf(ReadLines(DecidingFile())); }

  void AddSearchDomains(const DomainList& domains) override {
    const char* const path = DecidingFile();
    TextLines lines = ReadLines(path);
    // A search list would end the search in the host's own domain, so it takes that domain over.
    DomainList added;
    if (SearchListInForce().empty()) added = MissingDomains(ImplicitSearchList(), domains);
    added.insert(added.end(), domains.begin(), domains.end());
    AppendToSearchList(&lines, added);
    HostMgmt::ReplaceFile(path, HostMgmt::System::JoinLines(lines));
  }

  void Apply() override { HostMgmt::System::RunProgram({"/sbin/resolvconf", "-u"}); }
};

}  // namespace

std::unique_ptr<ResolverConfiguration> MakeResolvconfResolver() {
  return std::make_unique<ResolvconfResolver>();
}

}  // namespace KernCtl::Network
