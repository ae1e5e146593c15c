#include "kernctl/default_route.h"

#include <net/route.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <optional>

#include "system/read_file.h"
#include "system/text_lines.h"

namespace KernCtl::Network {
namespace {

constexpr char kRouteTable[] = "/proc/thread-self/net/route";

struct Route {
  std::string interface;
  std::uint32_t metric = 0;
};

std::uint32_t ToNumber(const std::string& text, int base) {
  std::uint32_t number = 0;
  std::from_chars(text.data(), text.data() + text.size(), number, base);
  return number;
}

/// Reads a line of the table: interface, destination, gateway, flags, reference count, use, metric, mask and
/// more. Returns nothing when it is not a default route that is up.
std::optional<Route> ParseDefaultRoute(const std::string& line) {
  const std::vector<std::string> words = HostMgmt::System::SplitWords(line);
  if (words.size() < 8 || words[1] != "00000000" || words[7] != "00000000") return std::nullopt;
  const std::uint32_t flags = ToNumber(words[3], 16);
  if ((flags & RTF_UP) == 0 || (flags & RTF_REJECT) != 0) return std::nullopt;
  return Route{words[0], ToNumber(words[6], 10)};
}

}  // namespace

std::vector<std::string> DefaultRouteInterfaces() {
  std::vector<Route> routes;
  const std::string table = HostMgmt::System::ReadFile(kRouteTable).value_or("");
  for (const HostMgmt::System::TextLine& line : HostMgmt::System::SplitLines(table)) {
    const std::optional<Route> route = ParseDefaultRoute(line.text);
    if (route) routes.push_back(*route);
  }
  std::stable_sort(routes.begin(), routes.end(),
                   [](const Route& left, const Route& right) { return left.metric < right.metric; });
  std::vector<std::string> names;
  names.reserve(routes.size());
  for (const Route& route : routes) names.push_back(route.interface);
  return names;
}

}  // namespace KernCtl::Network
