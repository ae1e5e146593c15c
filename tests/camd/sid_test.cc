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

constexpr const char* kOwner = "S-1-5-32-544";

/// A security descriptor with that place for its owner, who follows the header.
std::string DescriptorWith(char place) {
  return "\1\0\0\x80"s + place + "\0\0\0"s + std::string(12, '\0') + "\1\2\0\0\0\0\0\5\x20\0\0\0\x20\2\0\0"s;
}

TEST(SidTest, OwnerIsReadFromADescriptor) {
  EXPECT_EQ(OwnerText(DescriptorWith(20)), kOwner);
}

TEST(SidTest, DescriptorWithoutAnOwnerNamesNone) {
  EXPECT_EQ(OwnerText(DescriptorWith(0)), "");
}

TEST(SidTest, DescriptorThatIsCutOffNamesNoOwner) {
  const std::string whole = DescriptorWith(20);
  for (std::size_t size = 0; size < whole.size(); ++size)
    EXPECT_EQ(OwnerText(whole.substr(0, size)), "") << size;
}

TEST(SidTest, OwnerOutsideOfTheDescriptorIsNone) {
  EXPECT_EQ(OwnerText(DescriptorWith('\x7f')), "");
}

TEST(SidTest, BytesOfAnotherLengthAreRefused) {
  EXPECT_THROW(SidText(""), Failure);
  EXPECT_THROW(SidText("\1\2\0\0\0\0\0\5\x15\0\0\0"s), Failure);
}

}  // namespace
}  // namespace camd
