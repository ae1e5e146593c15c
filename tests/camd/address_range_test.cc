#include "service/address_range.h"

#include <gtest/gtest.h>

namespace camd {
namespace {

bool Contains(const std::string& range, const std::string& address) {
  return AddressRange::Parse(range).value().Contains(Address::Parse(address).value());
}

TEST(AddressRangeTest, RangeHoldsItsFirstAndLastAddress) {
  EXPECT_TRUE(Contains("10.99.4.0/22", "10.99.4.0"));
  EXPECT_TRUE(Contains("10.99.4.0/22", "10.99.7.255"));
}

TEST(AddressRangeTest, RangeDoesNotHoldItsNeighbours) {
  EXPECT_FALSE(Contains("10.99.4.0/22", "10.99.3.255"));
  EXPECT_FALSE(Contains("10.99.4.0/22", "10.99.8.0"));
}

TEST(AddressRangeTest, AddressAloneIsARangeOfOne) {
  EXPECT_TRUE(Contains("10.99.0.1", "10.99.0.1"));
  EXPECT_FALSE(Contains("10.99.0.1", "10.99.0.0"));
  EXPECT_TRUE(Contains("2001:db8::1", "2001:db8::1"));
  EXPECT_FALSE(Contains("2001:db8::1", "2001:db8::2"));
}

TEST(AddressRangeTest, LengthOfZeroHoldsTheWholeFamily) {
  EXPECT_TRUE(Contains("0.0.0.0/0", "203.0.113.9"));
  EXPECT_FALSE(Contains("0.0.0.0/0", "2001:db8::1"));
  EXPECT_TRUE(Contains("::/0", "2001:db8::1"));
}

TEST(AddressRangeTest, MappedAddressIsTheIpv4Address) {
  EXPECT_TRUE(Contains("10.0.0.0/8", "::ffff:10.1.2.3"));
}

TEST(AddressRangeTest, TextThatIsNoRangeIsRefused) {
  for (const char* text : {"", "/", "10.0.0.0/", "10.0.0.0/33", "10.0.0.0/-1", "10.0.0.0/8x", "10.0.0.0/8/8",
                           "10.0.0", "host", "2001:db8::/129", "010.0.0.0/8", " 10.0.0.0/8"}) {
    EXPECT_FALSE(AddressRange::Parse(text)) << text;
  }
}

TEST(AddressRangeTest, BitsBehindTheLengthAreRefused) {
  EXPECT_FALSE(AddressRange::Parse("10.0.0.1/24"));
  EXPECT_FALSE(AddressRange::Parse("2001:db8::1/32"));
}

TEST(AddressTest, TextIsInTheFamilysOwnForm) {
  EXPECT_EQ(Address::Parse("10.1.2.3")->Text(), "10.1.2.3");
  EXPECT_EQ(Address::Parse("2001:DB8:0:0:0:0:0:1")->Text(), "2001:db8::1");
}

TEST(AddressTest, Ipv6ClientIsItsNetwork) {
  EXPECT_EQ(Address::Parse("2001:db8:1:2:3:4:5:6")->Client(), Address::Parse("2001:db8:1:2::")->Client());
  EXPECT_NE(Address::Parse("2001:db8:1:2::")->Client(), Address::Parse("2001:db8:1:3::")->Client());
}

TEST(AddressTest, Ipv4ClientIsItself) {
  EXPECT_NE(Address::Parse("10.0.0.1")->Client(), Address::Parse("10.0.0.2")->Client());
}

}  // namespace
}  // namespace camd
