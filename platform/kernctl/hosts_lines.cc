#include "kernctl/hosts_lines.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>
#include <cstddef>
#include <cstring>

namespace KernCtl::Network {
namespace {

using HostMgmt::System::InsertLine;
using HostMgmt::System::TextLine;
using HostMgmt::System::TextLines;

/// A line taken apart. A line without an entry has an empty address.
struct ParsedLine {
  HostsEntry entry;
  std::string comment;
};

ParsedLine Parse(const std::string& text) {
  ParsedLine line;
  const std::size_t hash = text.find('#');
  if (hash != std::string::npos) line.comment = text.substr(hash);
  line.entry.names = HostMgmt::System::SplitWords(std::string_view(text).substr(0, hash));
  if (line.entry.names.empty()) return line;
  line.entry.address = line.entry.names.front();
  line.entry.names.erase(line.entry.names.begin());
  return line;
}

std::string Format(const HostsEntry& entry, const std::string& comment) {
  return entry.address + "\t" + HostMgmt::System::JoinWords(entry.names) +
         (comment.empty() ? "" : "\t" + comment);
}

/// One address can be written in several ways, above all in IPv6.
bool SameAddress(const std::string& left, const std::string& right) {
  if (left == right) return true;
  in6_addr one{};
  in6_addr other{};
  return inet_pton(AF_INET6, left.c_str(), &one) == 1 && inet_pton(AF_INET6, right.c_str(), &other) == 1 &&
         std::memcmp(&one, &other, sizeof(one)) == 0;
}

bool SharesName(const HostsEntry& left, const HostsEntry& right) {
  return std::any_of(left.names.begin(), left.names.end(), [&right](const std::string& one) {
    return std::any_of(right.names.begin(), right.names.end(), [&one](const std::string& other) {
      return HostMgmt::System::EqualIgnoringCase(one, other);
    });
  });
}

/// Where the lines stand that matter for an entry. The number of lines stands for none.
struct Places {
  std::size_t ownCount = 0;
  std::size_t firstOwn;
  /// The first line that gives one of the entry's names to another address.
  std::size_t firstRival;
};

Places Find(const TextLines& lines, const HostsEntry& entry) {
  Places places{0, lines.size(), lines.size()};
  for (std::size_t index = 0; index < lines.size(); ++index) {
    const HostsEntry other = Parse(lines[index].text).entry;
    if (SameAddress(other.address, entry.address)) {
      if (places.ownCount++ == 0) places.firstOwn = index;
    } else if (SharesName(other, entry)) {
      places.firstRival = std::min(places.firstRival, index);
    }
  }
  return places;
}

/// Removes the entries of the address from `start` on. A comment at the end of such a line stays, as a line
/// of its own.
void RemoveEntries(TextLines* lines, std::size_t start, const std::string& address) {
  for (std::size_t index = start; index < lines->size();) {
    const ParsedLine line = Parse((*lines)[index].text);
    if (!SameAddress(line.entry.address, address)) {
      ++index;
    } else if (!line.comment.empty()) {
      (*lines)[index++].text = line.comment;
    } else {
      lines->erase(lines->begin() + static_cast<std::ptrdiff_t>(index));
    }
  }
}

}  // namespace

bool PutEntry(TextLines* lines, const HostsEntry& entry) {
  const Places places = Find(*lines, entry);
  const bool wins = places.firstOwn < places.firstRival;
  if (wins) {
    TextLine& line = (*lines)[places.firstOwn];
    const ParsedLine old = Parse(line.text);
    if (places.ownCount == 1 && old.entry.address == entry.address && old.entry.names == entry.names) {
      return false;
    }
    line.text = Format(entry, old.comment);
    RemoveEntries(lines, places.firstOwn + 1, entry.address);
    return true;
  }
  std::string comment;
  if (places.ownCount > 0) {
    comment = Parse((*lines)[places.firstOwn].text).comment;
    lines->erase(lines->begin() + static_cast<std::ptrdiff_t>(places.firstOwn));
  }
  RemoveEntries(lines, 0, entry.address);
  InsertLine(lines, places.firstRival, Format(entry, comment));
  return true;
}

}  // namespace KernCtl::Network
