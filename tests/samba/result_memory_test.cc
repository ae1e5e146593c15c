// Memory for the caller.

#include "plugin/result_memory.h"

#include <gtest/gtest.h>

namespace sambaprovider {
namespace {

TEST(ResultMemoryTest, ATextIsCopied) {
  char* const text = CopyForCaller(std::string("abc"));
  EXPECT_STREQ(text, "abc");
  ReleaseResult(text);
}

TEST(ResultMemoryTest, AListEndsWithANullPointer) {
  char** const names = CopyForCaller(std::vector<std::string>{"one", "", "three"});
  EXPECT_STREQ(names[0], "one");
  EXPECT_STREQ(names[1], "");
  EXPECT_STREQ(names[2], "three");
  EXPECT_EQ(names[3], nullptr);
  ReleaseResult(names);
}

TEST(ResultMemoryTest, AnEmptyListHasItsTerminator) {
  char** const names = CopyForCaller(std::vector<std::string>{});
  EXPECT_EQ(names[0], nullptr);
  ReleaseResult(names);
}

TEST(ResultMemoryTest, ADomainWithoutADnsNameHasAnEmptyOne) {
  ActiveDirectoryDomainPair** const domains =
      CopyForCaller(std::vector<DomainNames>{{"corp.example", "CORP"}, {"", "OLD"}});
  EXPECT_STREQ(domains[0]->dnsName, "corp.example");
  EXPECT_STREQ(domains[0]->netbiosName, "CORP");
  EXPECT_STREQ(domains[1]->dnsName, "");
  EXPECT_STREQ(domains[1]->netbiosName, "OLD");
  EXPECT_EQ(domains[2], nullptr);
  ReleaseResult(domains);
}

TEST(ResultMemoryTest, NullMayBeReleased) {
  ReleaseResult(nullptr);
}

}  // namespace
}  // namespace sambaprovider
