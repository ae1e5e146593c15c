#include "service/host_name.h"

#include <gtest/gtest.h>

namespace camd {
namespace {

TEST(HostNameTest, ComputerNameIsTheFirstLabelInUpperCase) {
  EXPECT_EQ(ComputerNameOf("host-1.corp.example"), "HOST-1");
  EXPECT_EQ(ComputerNameOf("host-1"), "HOST-1");
}

TEST(HostNameTest, ComputerNameHasUpToFifteenCharacters) {
  EXPECT_EQ(ComputerNameOf("a23456789012345.corp.example"), "A23456789012345");
  EXPECT_EQ(ComputerNameOf("a234567890123456.corp.example"), "");
}

TEST(HostNameTest, ImpossibleComputerNameIsEmpty) {
  for (const char* name : {"", ".corp", "123", "-a", "a-", "a b", "a_b", "a$", "a*", "\xc3\xa4"}) {
    EXPECT_EQ(ComputerNameOf(name), "") << name;
  }
}

TEST(HostNameTest, EachLabelIsLookedAt) {
  EXPECT_TRUE(IsHostName("a.b-c.1"));
  for (const std::string& name : {std::string(), std::string("a..b"), std::string("a."), std::string("a.-b"),
                                  std::string("a.b_c"), std::string(64, 'a'),
                                  "a." + std::string(63, 'b') + "." + std::string(63, 'b') + "." +
                                      std::string(63, 'b') + "." + std::string(63, 'b')}) {
    EXPECT_FALSE(IsHostName(name)) << name;
  }
}

TEST(HostNameTest, PatternWithADotIsForTheWholeName) {
  EXPECT_TRUE(FitsAnyPattern("host1.corp.example", {"host?.corp.example"}));
  EXPECT_FALSE(FitsAnyPattern("host1.corp.example.org", {"host?.corp.example"}));
  EXPECT_FALSE(FitsAnyPattern("host1", {"host?.corp.example"}));
}

TEST(HostNameTest, PatternWithoutADotIsForTheFirstLabel) {
  EXPECT_TRUE(FitsAnyPattern("host1.corp.example", {"host*"}));
  EXPECT_FALSE(FitsAnyPattern("corp.host1.example", {"host*"}));
}

TEST(HostNameTest, CaseDoesNotCountInAPattern) {
  EXPECT_TRUE(FitsAnyPattern("Host1.Corp.Example", {"hOST1.*"}));
}

TEST(HostNameTest, NoPatternFitsNothing) {
  EXPECT_FALSE(FitsAnyPattern("host1", {}));
}

}  // namespace
}  // namespace camd
