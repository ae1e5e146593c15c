// Which network interface is the host's management interface.
#include <gtest/gtest.h>

#include <cstdlib>
#include <memory>
#include <string>

#include "hostmgmt/host.h"
#include "hostmgmt/host_management_exception.h"
#include "kernctl/network_info.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using HostMgmt::Lib::HostMgmtException;
using KernCtl::Network::NetworkInfoImpl;
using KernCtl::Network::NetworkInterface;

/// Changes the sandbox's network with the command that administrators use.
void Ip(const std::string& arguments) {
  ASSERT_EQ(std::system(("ip " + arguments).c_str()), 0) << arguments;
}

std::string NameOf() {
  return NetworkInfoImpl().GetManagementInterface()->GetName();
}

std::string AddressOf() {
  return NetworkInfoImpl().GetManagementInterface()->GetIpConfig().GetIpv4Address().GetStringAddress();
}

void Configure(const std::string& name) {
  HostMgmt::HostFactory::GetHost()->SetStringOption("Net.ManagementInterface", name);
}

const std::string kNamed = ", which the advanced option 'Net.ManagementInterface' names, ";
const std::string kNone =
    "The host has no management interface: no network interface is up with an IPv4 address";

class ManagementInterfaceTest : public testing::Test {
 protected:
  void SetUp() override {
    testsupport::AddInterface("first", "10.1.0.1");
    testsupport::AddInterface("second", "10.2.0.1");
    testsupport::AddInterface("third", "10.3.0.1");
  }
};

TEST_F(ManagementInterfaceTest, IsTheFirstOneThatIsUp) {
  EXPECT_EQ(NameOf(), "first");
  EXPECT_EQ(AddressOf(), "10.1.0.1");
}

TEST_F(ManagementInterfaceTest, IsTheOneOfTheDefaultRoute) {
  Ip("route add default via 10.2.0.254 dev second onlink");
  EXPECT_EQ(NameOf(), "second");
  EXPECT_EQ(AddressOf(), "10.2.0.1");
}

TEST_F(ManagementInterfaceTest, IsTheOneOfTheDefaultRouteWithTheLowestMetric) {
  Ip("route add default via 10.2.0.254 dev second onlink metric 200");
  Ip("route add default via 10.3.0.254 dev third onlink metric 100");
  EXPECT_EQ(NameOf(), "third");
}

TEST_F(ManagementInterfaceTest, AnotherRouteIsNoDefaultRoute) {
  Ip("route add 0.0.0.0/1 via 10.2.0.254 dev second onlink");
  Ip("route add 192.168.0.0/16 via 10.2.0.254 dev second onlink");
  EXPECT_EQ(NameOf(), "first");
}

TEST_F(ManagementInterfaceTest, ARouteThatRefusesIsNoDefaultRoute) {
  Ip("route add unreachable default");
  EXPECT_EQ(NameOf(), "first");
}

TEST_F(ManagementInterfaceTest, ADefaultRouteWithoutAnAddressIsPassedOver) {
  Ip("addr flush dev second");
  Ip("route add default dev second");
  EXPECT_EQ(NameOf(), "first");
}

TEST_F(ManagementInterfaceTest, AnInterfaceThatIsDownIsPassedOver) {
  Ip("link set first down");
  EXPECT_EQ(NameOf(), "second");
}

TEST_F(ManagementInterfaceTest, AnInterfaceWithoutAnIpv4AddressIsPassedOver) {
  Ip("addr flush dev first");
  Ip("addr add fd00::1/64 dev first");
  EXPECT_EQ(NameOf(), "second");
}

TEST_F(ManagementInterfaceTest, ALoopbackAddressIsPassedOver) {
  Ip("addr flush dev first");
  Ip("addr add 127.0.5.1/24 dev first");
  EXPECT_EQ(NameOf(), "second");
}

TEST_F(ManagementInterfaceTest, TheFirstOfSeveralAddressesIsTaken) {
  Ip("addr add 10.1.0.7/24 dev first label first:1");
  EXPECT_EQ(AddressOf(), "10.1.0.1");
}

TEST_F(ManagementInterfaceTest, IsTheOneThatTheOptionNames) {
  Ip("route add default via 10.2.0.254 dev second onlink");
  Configure("third");
  EXPECT_EQ(NameOf(), "third");
  EXPECT_EQ(AddressOf(), "10.3.0.1");
}

TEST_F(ManagementInterfaceTest, ANamedInterfaceThatDoesNotExistIsReported) {
  Configure("eth7");
  EXPECT_THROW_WHAT(NameOf(), HostMgmtException, "The network interface 'eth7'" + kNamed + "does not exist");
}

TEST_F(ManagementInterfaceTest, ANamedInterfaceThatIsDownIsReported) {
  Configure("third");
  Ip("link set third down");
  EXPECT_THROW_WHAT(NameOf(), HostMgmtException, "The network interface 'third'" + kNamed + "is down");
}

TEST_F(ManagementInterfaceTest, ANamedInterfaceWithoutAnAddressIsReported) {
  Configure("third");
  Ip("addr flush dev third");
  EXPECT_THROW_WHAT(NameOf(), HostMgmtException,
                    "The network interface 'third'" + kNamed + "has no IPv4 address");
}

TEST_F(ManagementInterfaceTest, AnOptionThatIsNoNameIsReported) {
  HostMgmt::HostFactory::GetHost()->SetIntegerOption("Net.ManagementInterface", 1);
  EXPECT_THROW_WHAT(NameOf(), HostMgmtException,
                    "The advanced option 'Net.ManagementInterface' is not the name of an interface");
}

TEST_F(ManagementInterfaceTest, AnOptionThatTheHostDoesNotHaveNamesNothing) {
  testsupport::WriteFile("/etc/quenix/options.conf", "Net.ManagementInterface = none\n");
  EXPECT_EQ(NameOf(), "first");
}

TEST_F(ManagementInterfaceTest, OptionsThatCannotBeReadAreReported) {
  testsupport::WriteFile("/etc/quenix/options.conf", "rubbish\n");
  EXPECT_THROW_WHAT(NameOf(), HostMgmtException,
                    "Unable to read '/etc/quenix/options.conf': line 1: there is no '='");
}

TEST_F(ManagementInterfaceTest, GivesItsAddressOfTheMoment) {
  const std::unique_ptr<NetworkInterface> interface = NetworkInfoImpl().GetManagementInterface();
  Ip("addr flush dev first");
  EXPECT_THROW_WHAT(interface->GetIpConfig(), HostMgmtException,
                    "The network interface 'first' has no IPv4 address");
  Ip("addr add 10.1.0.9/24 dev first");
  EXPECT_EQ(interface->GetIpConfig().GetIpv4Address().GetStringAddress(), "10.1.0.9");
}

TEST(NoManagementInterfaceTest, IsReported) {
  EXPECT_THROW_WHAT(NetworkInfoImpl().GetManagementInterface(), HostMgmtException, kNone);
}

TEST(NoManagementInterfaceTest, AnAddressOfTheLoopbackInterfaceDoesNotServe) {
  Ip("addr add 10.9.0.1/32 dev lo");
  EXPECT_THROW_WHAT(NetworkInfoImpl().GetManagementInterface(), HostMgmtException, kNone);
}

}  // namespace
