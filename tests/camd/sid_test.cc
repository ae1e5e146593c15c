#include <gtest/gtest.h>

#include "common/status.h"
#include "helper/directory.h"

namespace camd {
namespace {

using std::string_literals::operator""s;

TEST(SidTest, DomainsIdentifierIsWrittenOut) {
  EXPECT_EQ(SidText("\1\4\0\0\0\0\0\5\x15\0\0\0\1\0\0\0\2\0\0\0\xff\xff\xff\xff"s),
            "S-1-5-21-1-2-4294967295");
}

TEST(SidTest, AuthorityIsBigEndian) {
  EXPECT_EQ(SidText("\1\0\0\0\0\0\1\0"s), "S-1-256");
}

TEST(SidTest, BytesOfAnotherLengthAreRefused) {
  EXPECT_THROW(SidText(""), Failure);
  EXPECT_THROW(SidText("\1\2\0\0\0\0\0\5\x15\0\0\0"s), Failure);
}

}  // namespace
}  // namespace camd
