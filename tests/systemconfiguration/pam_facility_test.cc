#include <gtest/gtest.h>

#include <sstream>
#include <string>
#include <utility>
#include <vector>

#include "support/expect_throw_what.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::Written;

// Written out again, so that a slip in the product's table shows.
const std::vector<std::pair<unsigned, std::string>> keywords = {
    {1, "account"}, {2, "auth"}, {3, "password"}, {4, "session"}};

PAMFacility FromNumber(unsigned number) {
  return PAMFacility(static_cast<PAMFacility::Facility>(number));
}

unsigned NumberOf(const PAMFacility& facility) {
  return static_cast<PAMFacility::Facility>(facility);
}

std::string TextOf(const PAMFacility& facility) {
  return static_cast<std::string>(facility);
}

TEST(PAMFacilityTest, EveryKeywordGivesItsNumber) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(NumberOf(PAMFacility(word)), number) << word;
}

TEST(PAMFacilityTest, EveryNumberGivesItsKeyword) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(TextOf(FromNumber(number)), word);
}

TEST(PAMFacilityTest, EnumeratorsHaveTheirNumbers) {
  EXPECT_EQ(unsigned{PAMFacility::Unset}, 0U);
  EXPECT_EQ(unsigned{PAMFacility::Account}, 1U);
  EXPECT_EQ(unsigned{PAMFacility::Auth}, 2U);
  EXPECT_EQ(unsigned{PAMFacility::Password}, 3U);
  EXPECT_EQ(unsigned{PAMFacility::Session}, 4U);
}

TEST(PAMFacilityTest, TheEnumerationTakesThirtyTwoBits) {
  EXPECT_EQ(sizeof(PAMFacility::Facility), 4U);
}

TEST(PAMFacilityTest, IsUnsetWhenDefaultConstructed) {
  EXPECT_EQ(NumberOf(PAMFacility()), 0U);
}

TEST(PAMFacilityTest, ALeadingMinusIsNotUnderstood) {
  EXPECT_THROW_WHAT(PAMFacility("-session"), InvalidFacilityException, "Invalid Facility: -session");
}

TEST(PAMFacilityTest, CaseMatters) {
  EXPECT_THROW_WHAT(PAMFacility("Auth"), InvalidFacilityException, "Invalid Facility: Auth");
}

TEST(PAMFacilityTest, TheEmptyStringIsNoFacility) {
  EXPECT_THROW_WHAT(PAMFacility(std::string()), InvalidFacilityException, "Invalid Facility: ");
}

TEST(PAMFacilityTest, TakesAnAssignedValue) {
  PAMFacility facility;
  facility = PAMFacility::Password;
  EXPECT_EQ(NumberOf(facility), 3U);
}

TEST(PAMFacilityTest, TakesAnAssignedWord) {
  PAMFacility facility;
  facility = "session";
  EXPECT_EQ(NumberOf(facility), 4U);
}

TEST(PAMFacilityTest, IsUnchangedWhenAnAssignedWordIsNoFacility) {
  PAMFacility facility(PAMFacility::Auth);
  EXPECT_THROW_WHAT(facility = "passwd", InvalidFacilityException, "Invalid Facility: passwd");
  EXPECT_EQ(NumberOf(facility), 2U);
}

TEST(PAMFacilityTest, EqualsAFacilityOfTheSameValue) {
  EXPECT_TRUE(PAMFacility(PAMFacility::Auth) == PAMFacility("auth"));
  EXPECT_FALSE(PAMFacility(PAMFacility::Auth) == PAMFacility("account"));
}

TEST(PAMFacilityTest, ComparesWithTheFacilityThatAWordMeans) {
  EXPECT_TRUE(PAMFacility(PAMFacility::Auth) == "auth");
  EXPECT_FALSE(PAMFacility(PAMFacility::Auth) == "account");
}

TEST(PAMFacilityTest, CannotBeComparedWithAWordThatIsNoFacility) {
  EXPECT_THROW_WHAT(PAMFacility(PAMFacility::Auth) == "AUTH", InvalidFacilityException,
                    "Invalid Facility: AUTH");
}

TEST(PAMFacilityTest, ConstantFacilitiesCompareFromEitherSide) {
  const PAMFacility facility("auth");
  EXPECT_TRUE(facility == PAMFacility::Auth);
  EXPECT_TRUE(PAMFacility::Auth == facility);
  EXPECT_TRUE(std::string("auth") == facility);
  EXPECT_TRUE(facility != PAMFacility::Session);
}

TEST(PAMFacilityTest, UnsetHasNoKeyword) {
  EXPECT_THROW_WHAT(TextOf(PAMFacility()), InvalidFacilityException, "Invalid Facility: ");
}

TEST(PAMFacilityTest, AValueWithoutKeywordShortensItsMessageByItself) {
  EXPECT_THROW_WHAT(TextOf(FromNumber(5)), InvalidFacilityException, "id Facility: ");
  EXPECT_THROW_WHAT(TextOf(FromNumber(17)), InvalidFacilityException, " ");
  EXPECT_THROW_WHAT(TextOf(FromNumber(18)), InvalidFacilityException, "");
}

TEST(PAMFacilityTest, AnyLargerValueStillThrows) {
  EXPECT_THROW(TextOf(FromNumber(19)), InvalidFacilityException);
  EXPECT_THROW(TextOf(FromNumber(0xffffffffU)), InvalidFacilityException);
}

TEST(PAMFacilityTest, IsWrittenAsItsKeyword) {
  EXPECT_EQ(Written(PAMFacility("password")), "password");
}

TEST(PAMFacilityTest, WritingUnsetThrowsAndWritesNothing) {
  std::ostringstream stream;
  EXPECT_THROW_WHAT(stream << PAMFacility(), InvalidFacilityException, "Invalid Facility: ");
  EXPECT_EQ(stream.str(), "");
}

TEST(PAMFacilityTest, IsReadFromOneWordBehindWhiteSpace) {
  std::istringstream stream(" \n\tauth required");
  PAMFacility facility;
  stream >> facility;
  EXPECT_EQ(NumberOf(facility), 2U);
  EXPECT_EQ(stream.tellg(), 7);
}

TEST(PAMFacilityTest, ReadingAnUnknownWordThrowsBehindIt) {
  std::istringstream stream("authorize required");
  PAMFacility facility(PAMFacility::Session);
  EXPECT_THROW_WHAT(stream >> facility, InvalidFacilityException, "Invalid Facility: authorize");
  EXPECT_EQ(NumberOf(facility), 4U);
  EXPECT_EQ(stream.tellg(), 9);
}

TEST(PAMFacilityTest, ReadingAtTheEndThrowsForTheEmptyWord) {
  std::istringstream stream("");
  PAMFacility facility;
  EXPECT_THROW_WHAT(stream >> facility, InvalidFacilityException, "Invalid Facility: ");
  EXPECT_TRUE(stream.fail());
}

}  // namespace
}  // namespace SystemConfiguration
