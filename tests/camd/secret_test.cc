#include "common/secret.h"

#include <gtest/gtest.h>

#include <utility>

namespace camd {
namespace {

TEST(SecretTest, TextIsFollowedByAZeroByte) {
  const Secret secret(std::string_view("abc"));
  EXPECT_STREQ(secret.Text(), "abc");
  EXPECT_EQ(secret.View(), "abc");
}

TEST(SecretTest, EmptyOneIsATextToo) {
  EXPECT_STREQ(Secret().Text(), "");
}

TEST(SecretTest, MovedOneIsLeftEmpty) {
  Secret first(std::string_view("abc"));
  const Secret second(std::move(first));
  EXPECT_EQ(second.View(), "abc");
  EXPECT_EQ(first.View(), "");  // NOLINT(bugprone-use-after-move): what a moved one holds is promised
}

TEST(SecretTest, WhatIsCutOffIsWiped) {
  Secret secret(std::string_view("abcdef"));
  const char* bytes = secret.Text();
  secret.Shorten(2);
  EXPECT_EQ(secret.View(), "ab");
  EXPECT_EQ(std::string_view(bytes, 6), std::string_view("ab\0\0\0\0", 6));
}

}  // namespace
}  // namespace camd
