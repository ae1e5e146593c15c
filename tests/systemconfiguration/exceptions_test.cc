#include <gtest/gtest.h>

#include <exception>
#include <memory>
#include <string>
#include <type_traits>

#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

template <class Exception>
class SystemConfigurationExceptionTest : public ::testing::Test {};

using Exceptions =
    ::testing::Types<InvalidControlException, InvalidFacilityException, InvalidDatabaseException>;
TYPED_TEST_SUITE(SystemConfigurationExceptionTest, Exceptions);

TYPED_TEST(SystemConfigurationExceptionTest, WhatIsTheMessageGivenAtConstruction) {
  EXPECT_STREQ(TypeParam(std::string("the message")).what(), "the message");
}

TYPED_TEST(SystemConfigurationExceptionTest, ACopyOutlivesItsOriginalsMessage) {
  auto original = std::make_unique<TypeParam>(std::string(100, 'm'));
  const TypeParam copy = *original;
  original.reset();
  EXPECT_EQ(copy.what(), std::string(100, 'm'));
}

TYPED_TEST(SystemConfigurationExceptionTest, IsCaughtAsAStandardException) {
  try {
    throw TypeParam("caught");
  } catch (const std::exception& caught) {
    EXPECT_STREQ(caught.what(), "caught");
  }
}

TYPED_TEST(SystemConfigurationExceptionTest, AddsOnlyItsMessageToTheStandardException) {
  EXPECT_EQ(sizeof(TypeParam), sizeof(std::exception) + sizeof(std::string));
}

// Derived from each other, one would be caught for the other.
static_assert(!std::is_convertible_v<InvalidControlException*, InvalidFacilityException*>);
static_assert(!std::is_convertible_v<InvalidFacilityException*, InvalidControlException*>);
static_assert(!std::is_convertible_v<InvalidDatabaseException*, InvalidControlException*>);

}  // namespace
}  // namespace SystemConfiguration
