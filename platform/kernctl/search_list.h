#ifndef PLATFORM_KERNCTL_SEARCH_LIST_H
#define PLATFORM_KERNCTL_SEARCH_LIST_H

#include <string>
#include <vector>

#include "system/text_lines.h"

namespace KernCtl::Network {

using DomainList = std::vector<std::string>;

/// Domain names are equal without regard to letter case and a trailing dot.
bool ContainsDomain(const DomainList& list, const std::string& domain);

/// The domains that `list` does not contain, each once, in their order.
DomainList MissingDomains(const DomainList& domains, const DomainList& list);

/// Tells whether the lines of a resolv.conf set the search list at all.
bool SetsSearchList(const HostMgmt::System::TextLines& lines);

/// The search list that the lines of a resolv.conf set. Of several `search` and `domain` lines the last one
/// holds, and a `domain` line is a list of one domain.
DomainList SearchListOf(const HostMgmt::System::TextLines& lines);

/// Adds the domains to the end of the search list that the lines set. A `domain` line that sets it becomes a
/// `search` line, because either excludes the other.
void AppendToSearchList(HostMgmt::System::TextLines* lines, const DomainList& domains);

}  // namespace KernCtl::Network

#endif
