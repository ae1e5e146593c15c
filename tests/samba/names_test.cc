// Which names are possible, and their parts.

#include "common/names.h"

#include <gtest/gtest.h>

#include "expect_failure.h"
#include "support/machine.h"

namespace sambaprovider {
namespace {

TEST(NamesTest, AComputerNameHasAtMostFifteenCharacters) {
  EXPECT_TRUE(IsComputerName("abcdefghijklmno"));
  EXPECT_FALSE(IsComputerName("abcdefghijklmnop"));
  EXPECT_FALSE(IsComputerName(""));
}

TEST(NamesTest, AComputerNameHasLettersDigitsAndInnerHyphensOnly) {
  EXPECT_TRUE(IsComputerName("Host-1"));
  for (const char* name : {"ho st", "host_1", "h\xc3\xb6st", "host.x", "-host", "host-", "host$"}) {
    EXPECT_FALSE(IsComputerName(name)) << name;
  }
}

TEST(NamesTest, AComputerNameOfDigitsAloneIsRefused) {
  EXPECT_FALSE(IsComputerName("12345"));
}

TEST(NamesTest, ADnsNameHasNoCharacterThatAConfigurationFileKnows) {
  EXPECT_TRUE(IsDnsName("dc-1.corp.example"));
  EXPECT_TRUE(IsDnsName("corp"));
  for (const char* name : {"", ".", "a..b", "a b", "a\nb", "a;b", "a#b", "a=b", "corp.", "-a.b"}) {
    EXPECT_FALSE(IsDnsName(name)) << name;
  }
  EXPECT_FALSE(IsDnsName(std::string(64, 'a') + ".example"));
}

TEST(NamesTest, ANetbiosNameCannotLeaveItsLine) {
  EXPECT_TRUE(IsNetbiosName("CORP"));
  for (const char* name : {"", "CO RP", "CORP\n", "CO;RP", "CO/RP", "CO\\RP", "CO=RP", "ABCDEFGHIJKLMNOP"}) {
    EXPECT_FALSE(IsNetbiosName(name)) << name;
  }
}

TEST(NamesTest, AControllerMayBeGivenByItsAddress) {
  EXPECT_TRUE(IsControllerName("10.99.0.10"));
  EXPECT_TRUE(IsControllerName("fd00::10"));
  EXPECT_TRUE(IsControllerName("dc1.corp.example"));
  EXPECT_FALSE(IsControllerName("dc1 *"));
}

TEST(NamesTest, AnAccountNameIsSplitAtItsBackslash) {
  const AccountName name = SplitAccountName("CORP\\alice@x");
  EXPECT_EQ(name.domain, "CORP");
  EXPECT_EQ(name.user, "alice@x");
}

TEST(NamesTest, AnAccountNameIsSplitAtItsLastAtSign) {
  const AccountName name = SplitAccountName("alice@home@corp.example");
  EXPECT_EQ(name.domain, "corp.example");
  EXPECT_EQ(name.user, "alice@home");
}

TEST(NamesTest, ABareAccountNameHasNoDomain) {
  const AccountName name = SplitAccountName("alice");
  EXPECT_EQ(name.domain, "");
  EXPECT_EQ(name.user, "alice");
}

TEST(NamesTest, OneTrailingDotIsTakenAway) {
  EXPECT_EQ(WithoutTrailingDot("corp.example."), "corp.example");
  EXPECT_EQ(WithoutTrailingDot("."), ".");
}

TEST(NamesTest, ADomainHasADistinguishedName) {
  EXPECT_EQ(DomainDn("corp.example"), "DC=corp,DC=example");
}

TEST(NamesTest, TheHostsShortNameEndsAtTheFirstDot) {
  testsupport::SetHostName("host1.corp.example");
  EXPECT_EQ(HostShortName(), "host1");
}

TEST(NamesTest, AHostNameThatIsNoComputerNameIsRefused) {
  testsupport::SetHostName("averyverylonghostname");
  EXPECT_FAILURE(HostShortName(), 1210);
}

TEST(NamesTest, TheHostsDnsNameIsInLowerCase) {
  EXPECT_EQ(HostDnsName("HOST1", "Corp.Example"), "host1.corp.example");
}

}  // namespace
}  // namespace sambaprovider
