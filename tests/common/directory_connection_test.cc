#include "velmor/directory_connection.h"

#include <gtest/gtest.h>

#include "velmor/failure.h"

namespace velmor {
namespace {

template <typename Action>
uint32_t StatusOf(Action action) {
  try {
    action();
  } catch (const Failure& failure) {
    return failure.Code();
  }
  return 0;
}

TEST(GeneralizedTimeTest, ItIsUniversalTime) {
  EXPECT_EQ(ParseGeneralizedTime("19700102000001.0Z"), 86401);
  EXPECT_EQ(ParseGeneralizedTime("20261121010203.0Z"), 1795222923);
}

TEST(GeneralizedTimeTest, AnythingElseIsNone) {
  EXPECT_EQ(ParseGeneralizedTime(""), std::nullopt);
  EXPECT_EQ(ParseGeneralizedTime("tomorrow"), std::nullopt);
}

TEST(DirectoryEntryTest, AnAttributeThatItLacksIsEmpty) {
  const DirectoryEntry entry{"CN=host", {{"cn", "host"}}};
  EXPECT_EQ(entry.Value("cn"), "host");
  EXPECT_EQ(entry.Value("dNSHostName"), "");
}

TEST(DirectoryConnectionTest, AControllerThatDoesNotAnswerIsReportedAsSuch) {
  DirectoryConnection connection("127.0.0.1", std::chrono::seconds(5));
  EXPECT_EQ(StatusOf([&] { connection.ReadRootEntry(); }), 1311U);
}

TEST(DirectoryConnectionTest, AnAddressOfVersionSixIsOne) {
  DirectoryConnection connection("::1", std::chrono::seconds(5));
  EXPECT_EQ(StatusOf([&] { connection.ReadRootEntry(); }), 1311U);
}

TEST(DirectoryConnectionTest, ANameThatIsNoneIsRefused) {
  EXPECT_EQ(StatusOf([] { DirectoryConnection("a/b?c?d?e?f?g", std::chrono::seconds(5)); }), 1359U);
}

}  // namespace
}  // namespace velmor
