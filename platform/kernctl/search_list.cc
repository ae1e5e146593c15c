#include "kernctl/search_list.h"

#include <algorithm>
#include <cstddef>
#include <string_view>

namespace KernCtl::Network {
namespace {

using HostMgmt::System::JoinWords;
using HostMgmt::System::SplitWords;
using HostMgmt::System::TextLines;

std::string_view WithoutTrailingDot(std::string_view domain) {
  if (!domain.empty() && domain.back() == '.') domain.remove_suffix(1);
  return domain;
}

/// The resolver knows a keyword only at the very start of a line and before a blank, and passes over a
/// keyword without a value.
bool HasKeyword(const std::string& text, std::string_view keyword) {
  return text.size() > keyword.size() && text.compare(0, keyword.size(), keyword) == 0 &&
         (text[keyword.size()] == ' ' || text[keyword.size()] == '\t') && SplitWords(text).size() > 1;
}

/// Where the value of a line ends and what people write as a comment begins, although the resolver knows no
/// comment there.
std::size_t EndOfValue(const std::string& text) {
  std::size_t end = text.size();
  for (const std::string_view start : {" #", " ;", "\t#", "\t;"}) end = std::min(end, text.find(start));
  return end;
}

/// The domains of a line that sets the search list.
DomainList DomainsOf(const std::string& text) {
  DomainList words = SplitWords(std::string_view(text).substr(0, EndOfValue(text)));
  words.erase(words.begin());
  if (HasKeyword(text, "domain") && words.size() > 1) words.resize(1);
  return words;
}

/// The line that sets its own domains and then the given ones. A comment stays at its end.
std::string Extend(const std::string& text, const DomainList& domains) {
  DomainList words = DomainsOf(text);
  words.insert(words.begin(), "search");
  words.insert(words.end(), domains.begin(), domains.end());
  return JoinWords(words) + text.substr(EndOfValue(text));
}

/// The line that sets the search list, or the number of lines when none does.
std::size_t FindSearchLine(const TextLines& lines) {
  for (std::size_t index = lines.size(); index > 0; --index) {
    const std::string& text = lines[index - 1].text;
    if (HasKeyword(text, "search") || HasKeyword(text, "domain")) return index - 1;
  }
  return lines.size();
}

}  // namespace

bool ContainsDomain(const DomainList& list, const std::string& domain) {
  return std::any_of(list.begin(), list.end(), [&domain](const std::string& listed) {
    return HostMgmt::System::EqualIgnoringCase(WithoutTrailingDot(listed), WithoutTrailingDot(domain));
  });
}

DomainList MissingDomains(const DomainList& domains, const DomainList& list) {
  DomainList missing;
  for (const std::string& domain : domains) {
    if (!ContainsDomain(list, domain) && !ContainsDomain(missing, domain)) missing.push_back(domain);
  }
  return missing;
}

bool SetsSearchList(const TextLines& lines) {
  return FindSearchLine(lines) < lines.size();
}

DomainList SearchListOf(const TextLines& lines) {
  const std::size_t index = FindSearchLine(lines);
  return index < lines.size() ? DomainsOf(lines[index].text) : DomainList();
}

void AppendToSearchList(TextLines* lines, const DomainList& domains) {
  const std::size_t index = FindSearchLine(*lines);
  if (index == lines->size()) {
    HostMgmt::System::InsertLine(lines, index, "search " + JoinWords(domains));
  } else {
    (*lines)[index].text = Extend((*lines)[index].text, domains);
  }
}

}  // namespace KernCtl::Network
