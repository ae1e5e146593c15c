// Internet addresses of clients and ranges of them.
#ifndef CAMD_SERVICE_ADDRESS_RANGE_H
#define CAMD_SERVICE_ADDRESS_RANGE_H

#include <sys/socket.h>

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace camd {

// An IPv6 address; an IPv4 address is kept as its IPv4-mapped one, so that a client counts as the same one
// whichever socket it came through.
class Address {
 public:
  static std::optional<Address> Parse(const std::string& text);
  // The address of a connection's other end. Other families give the unspecified address.
  static Address Of(const sockaddr* peer);

  bool IsIpv4() const;
  std::string Text() const;
  // What requests are counted by: the address, or, since a host commands all of them, its IPv6 network of 64
  // bits.
  Address Client() const;
  const std::array<uint8_t, 16>& Bytes() const { return bytes_; }

  bool operator==(const Address& other) const = default;
  bool operator<(const Address& other) const { return bytes_ < other.bytes_; }

 private:
  std::array<uint8_t, 16> bytes_ = {};
};

// The addresses that begin with the same bits ("10.99.0.0/24", "2001:db8::/32"), or one address.
class AddressRange {
 public:
  // Nothing for text that is no range, or that has bits set behind its length.
  static std::optional<AddressRange> Parse(const std::string& text);

  bool Contains(const Address& address) const;

 private:
  Address first_;
  unsigned int length_ = 128;
};

}  // namespace camd

#endif  // CAMD_SERVICE_ADDRESS_RANGE_H
