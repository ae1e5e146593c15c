// Which texts are IPv4 addresses.
#include <gtest/gtest.h>

#include <string>

#include "hostmgmt/host_management_exception.h"
#include "hostmgmt/ip_config.h"
#include "support/expect_throw_what.h"

namespace {

using HostMgmt::Network::IpConfig;
using HostMgmt::Network::Ipv4Address;

TEST(Ipv4AddressTest, DottedDecimalIsValid) {
  for (const char* address : {"0.0.0.0", "10.0.0.1", "192.168.100.20", "255.255.255.255"}) {
    EXPECT_TRUE(Ipv4Address::IsValidAddress(address)) << address;
  }
}

TEST(Ipv4AddressTest, AnythingElseIsNot) {
  for (const char* address : {"",           " ",          "host01",      "cam.corp.example", "10.0.0",
                              "10.0.0.1.2", "10.0.0.256", "10.0.0.-1",   "10.0.0.01",        " 10.0.0.1",
                              "10.0.0.1 ",  "10.0.0.1\n", "10.0.0.1/24", "10.0.0.1:443",     "0x0a.0.0.1",
                              "167772161",  "::1",        "fe80::1",     "::ffff:10.0.0.1",  "1234.0.0.1",
                              "10..0.1",    ".10.0.0.1"}) {
    EXPECT_FALSE(Ipv4Address::IsValidAddress(address)) << address;
  }
}

TEST(Ipv4AddressTest, NothingHidesBehindANullByte) {
  EXPECT_FALSE(Ipv4Address::IsValidAddress(std::string("10.0.0.1\0.evil", 14)));
}

TEST(Ipv4AddressTest, GivesItsText) {
  EXPECT_EQ(IpConfig(Ipv4Address("10.1.2.3")).GetIpv4Address().GetStringAddress(), "10.1.2.3");
}

TEST(Ipv4AddressTest, IsNotMadeOfAnotherText) {
  EXPECT_THROW_WHAT(Ipv4Address("host01"), HostMgmt::Lib::HostMgmtException,
                    "'host01' is not an IPv4 address");
}

}  // namespace
