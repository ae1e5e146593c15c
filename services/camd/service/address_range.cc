#include "service/address_range.h"

#include <arpa/inet.h>
#include <netinet/in.h>

#include <algorithm>
#include <charconv>
#include <cstring>

namespace camd {
namespace {

constexpr std::array<uint8_t, 12> kIpv4Prefix = {0, 0, 0, 0, 0, 0, 0, 0, 0, 0, 0xff, 0xff};
constexpr unsigned int kIpv4PrefixBits = 96;

bool BitOf(const Address& address, unsigned int index) {
  return (address.Bytes()[index / 8] >> (7 - index % 8) & 1) != 0;
}

std::optional<unsigned int> ParseLength(const std::string& text, unsigned int longest) {
  unsigned int length = 0;
  const char* end = text.data() + text.size();
  const auto [stop, error] = std::from_chars(text.data(), end, length);
  if (error != std::errc() || stop != end || length > longest) return std::nullopt;
  return length;
}

}  // namespace

std::optional<Address> Address::Parse(const std::string& text) {
  Address address;
  if (inet_pton(AF_INET6, text.c_str(), address.bytes_.data()) == 1) return address;
  std::copy(kIpv4Prefix.begin(), kIpv4Prefix.end(), address.bytes_.begin());
  if (inet_pton(AF_INET, text.c_str(), address.bytes_.data() + kIpv4Prefix.size()) == 1) return address;
  return std::nullopt;
}

Address Address::Of(const sockaddr* peer) {
  Address address;
  if (peer->sa_family == AF_INET6) {
    sockaddr_in6 whole;
    std::memcpy(&whole, peer, sizeof whole);
    std::memcpy(address.bytes_.data(), &whole.sin6_addr, address.bytes_.size());
  } else if (peer->sa_family == AF_INET) {
    sockaddr_in whole;
    std::memcpy(&whole, peer, sizeof whole);
    std::copy(kIpv4Prefix.begin(), kIpv4Prefix.end(), address.bytes_.begin());
    std::memcpy(address.bytes_.data() + kIpv4Prefix.size(), &whole.sin_addr, sizeof whole.sin_addr);
  }
  return address;
}

bool Address::IsIpv4() const {
  return std::equal(kIpv4Prefix.begin(), kIpv4Prefix.end(), bytes_.begin());
}

std::string Address::Text() const {
  std::array<char, INET6_ADDRSTRLEN> text = {};
  const bool ipv4 = IsIpv4();
  inet_ntop(ipv4 ? AF_INET : AF_INET6, bytes_.data() + (ipv4 ? kIpv4Prefix.size() : 0), text.data(),
            text.size());
  return text.data();
}

Address Address::Client() const {
  Address client = *this;
  if (!IsIpv4()) std::fill(client.bytes_.begin() + 8, client.bytes_.end(), uint8_t{0});
  return client;
}

std::optional<AddressRange> AddressRange::Parse(const std::string& text) {
  const size_t slash = text.find('/');
  const auto first = Address::Parse(text.substr(0, slash));
  if (!first) return std::nullopt;
  AddressRange range;
  range.first_ = *first;
  if (slash == std::string::npos) return range;
  const unsigned int before = first->IsIpv4() ? kIpv4PrefixBits : 0;
  const auto length = ParseLength(text.substr(slash + 1), 128 - before);
  if (!length) return std::nullopt;
  range.length_ = before + *length;
  for (unsigned int index = range.length_; index < 128; ++index) {
    if (BitOf(*first, index)) return std::nullopt;
  }
  return range;
}

bool AddressRange::Contains(const Address& address) const {
  for (unsigned int index = 0; index < length_; ++index) {
    if (BitOf(address, index) != BitOf(first_, index)) return false;
  }
  return true;
}

}  // namespace camd
