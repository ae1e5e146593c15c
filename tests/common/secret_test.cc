#include "velmor/secret.h"

#include <gtest/gtest.h>
#include <sys/mman.h>

#include <cstdint>
#include <sstream>
#include <string>
#include <utility>

#include "support/files.h"

namespace velmor {
namespace {

TEST(SecretTest, TextIsFollowedByAZeroByte) {
  const Secret secret(std::string_view("abc"));
  EXPECT_STREQ(secret.Text(), "abc");
  EXPECT_EQ(secret.View(), "abc");
}

TEST(SecretTest, EmptyOneIsATextToo) {
  EXPECT_STREQ(Secret().Text(), "");
  EXPECT_STREQ(Secret(0).Text(), "");
  EXPECT_STREQ(Secret(std::string_view()).Text(), "");
}

TEST(SecretTest, EmptyOneTakesNoMemory) {
  EXPECT_EQ(Secret(0).Data(), nullptr);
  EXPECT_EQ(Secret(std::string_view()).Data(), nullptr);
}

TEST(SecretTest, RoomIsZero) {
  const Secret secret(3);
  EXPECT_EQ(secret.View(), std::string_view("\0\0\0", 3));
}

TEST(SecretTest, MovedOneIsLeftEmpty) {
  Secret first(std::string_view("abc"));
  const char* const place = first.Text();
  const Secret second(std::move(first));
  EXPECT_EQ(second.View(), "abc");
  EXPECT_EQ(second.Text(), place);
  EXPECT_EQ(first.View(), "");  // NOLINT(bugprone-use-after-move): what a moved one holds is promised
}

TEST(SecretTest, AssignedOneGivesItsMemoryBack) {
  Secret secret(std::string_view("abc"));
  char* const place = secret.Data();
  secret = Secret(std::string_view("other"));
  EXPECT_EQ(secret.View(), "other");
  // Nothing is mapped there any more.
  EXPECT_EQ(msync(place, 1, MS_ASYNC), -1);
}

TEST(SecretTest, WhatIsCutOffIsWiped) {
  Secret secret(std::string_view("abcdef"));
  const char* bytes = secret.Text();
  secret.Shorten(2);
  EXPECT_EQ(secret.View(), "ab");
  EXPECT_EQ(std::string_view(bytes, 6), std::string_view("ab\0\0\0\0", 6));
}

/// The flags that the kernel keeps with the memory at this place.
std::string FlagsOfMemoryAt(const void* place) {
  std::ostringstream start;
  start << std::hex << reinterpret_cast<std::uintptr_t>(place) << '-';
  const std::string maps = testsupport::ReadFile("/proc/self/smaps");
  const std::size_t flags = maps.find("VmFlags:", maps.find(start.str()));
  return maps.substr(flags, maps.find('\n', flags) - flags) + " ";
}

TEST(SecretTest, CoreFilesDoNotHoldIt) {
  const Secret secret(std::string_view("abc"));
  EXPECT_NE(FlagsOfMemoryAt(secret.Text()).find(" dd "), std::string::npos);
}

}  // namespace
}  // namespace velmor
