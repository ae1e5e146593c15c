#include <gtest/gtest.h>

#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include "support/expect_throw_what.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

// Written out again, so that a slip in the product's table shows.
const std::vector<std::pair<unsigned, std::string>> keywords = {
    {1, "required"}, {2, "requisite"}, {3, "sufficient"}, {4, "optional"}, {5, "include"}, {6, "substack"}};

PAMControl FromNumber(unsigned number) {
  return PAMControl(static_cast<PAMControl::Control>(number));
}

unsigned NumberOf(const PAMControl& control) {
  return static_cast<PAMControl::Control>(control);
}

std::string TextOf(const PAMControl& control) {
  return static_cast<std::string>(control);
}

TEST(PAMControlTest, EveryKeywordGivesItsNumber) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(NumberOf(PAMControl(word)), number) << word;
}

TEST(PAMControlTest, EveryNumberGivesItsKeyword) {
  for (const auto& [number, word] : keywords) EXPECT_EQ(TextOf(FromNumber(number)), word);
}

TEST(PAMControlTest, EnumeratorsHaveTheirNumbers) {
  EXPECT_EQ(unsigned{PAMControl::Unset}, 0U);
  EXPECT_EQ(unsigned{PAMControl::Required}, 1U);
  EXPECT_EQ(unsigned{PAMControl::Requisite}, 2U);
  EXPECT_EQ(unsigned{PAMControl::Sufficient}, 3U);
  EXPECT_EQ(unsigned{PAMControl::Optional}, 4U);
  EXPECT_EQ(unsigned{PAMControl::Include}, 5U);
  EXPECT_EQ(unsigned{PAMControl::Substack}, 6U);
  EXPECT_EQ(unsigned{PAMControl::Bracketed}, 7U);
}

TEST(PAMControlTest, TheEnumerationTakesThirtyTwoBits) {
  EXPECT_EQ(sizeof(PAMControl::Control), 4U);
}

TEST(PAMControlTest, IsUnsetWhenDefaultConstructed) {
  EXPECT_EQ(NumberOf(PAMControl()), 0U);
}

TEST(PAMControlTest, KeepsABracketedControlAsRead) {
  const PAMControl control("[success=ok default=die]");
  EXPECT_EQ(NumberOf(control), 7U);
  EXPECT_EQ(TextOf(control), "[success=ok default=die]");
}

TEST(PAMControlTest, DoesNotLookIntoBrackets) {
  EXPECT_EQ(TextOf(PAMControl("[]] nonsense [[]")), "[]] nonsense [[]");
}

TEST(PAMControlTest, TwoBracketsAreABracketedControl) {
  EXPECT_EQ(NumberOf(PAMControl("[]")), 7U);
}

TEST(PAMControlTest, OneBracketIsNoControl) {
  EXPECT_THROW_WHAT(PAMControl("["), InvalidControlException, "Invalid Control: [");
  EXPECT_THROW_WHAT(PAMControl("]"), InvalidControlException, "Invalid Control: ]");
}

TEST(PAMControlTest, AnUnclosedBracketIsNoControl) {
  EXPECT_THROW_WHAT(PAMControl("[default=die"), InvalidControlException, "Invalid Control: [default=die");
}

TEST(PAMControlTest, CaseMatters) {
  EXPECT_THROW_WHAT(PAMControl("Required"), InvalidControlException, "Invalid Control: Required");
}

TEST(PAMControlTest, TheEmptyStringIsNoControl) {
  EXPECT_THROW_WHAT(PAMControl(std::string()), InvalidControlException, "Invalid Control: ");
}

TEST(PAMControlTest, AKeywordWithAZeroByteBehindItIsNoControl) {
  EXPECT_THROW(PAMControl(std::string("required\0", 9)), InvalidControlException);
}

TEST(PAMControlTest, StoresValueAndTextUnchecked) {
  const PAMControl keywordWithText(PAMControl::Required, "text");
  EXPECT_EQ(TextOf(keywordWithText), "required");
  const PAMControl bracketedWithoutBrackets(PAMControl::Bracketed, "no brackets");
  EXPECT_EQ(TextOf(bracketedWithoutBrackets), "no brackets");
}

TEST(PAMControlTest, IsBracketedWithoutTextWhenMadeFromThatValueAlone) {
  EXPECT_EQ(TextOf(PAMControl(PAMControl::Bracketed)), "");
}

TEST(PAMControlTest, AssigningAValueKeepsTheText) {
  PAMControl control("[a]");
  control = PAMControl::Required;
  EXPECT_EQ(TextOf(control), "required");
  control = PAMControl::Bracketed;
  EXPECT_EQ(TextOf(control), "[a]");
}

TEST(PAMControlTest, AssigningAKeywordKeepsTheText) {
  PAMControl control("[a]");
  control = "optional";
  EXPECT_EQ(TextOf(control), "optional");
  control = PAMControl::Bracketed;
  EXPECT_EQ(TextOf(control), "[a]");
}

TEST(PAMControlTest, AssigningABracketedTextReplacesTheText) {
  PAMControl control("[a]");
  control = std::string("[b]");
  EXPECT_EQ(TextOf(control), "[b]");
}

TEST(PAMControlTest, IsUnchangedWhenAnAssignedTextIsNoControl) {
  PAMControl control("[a]");
  EXPECT_THROW_WHAT(control = "sufficent", InvalidControlException, "Invalid Control: sufficent");
  EXPECT_EQ(TextOf(control), "[a]");
}

TEST(PAMControlTest, EqualsAControlOfTheSameValueWhateverTheText) {
  EXPECT_TRUE(PAMControl(PAMControl::Required, "a") == PAMControl(PAMControl::Required, "b"));
  EXPECT_FALSE(PAMControl(PAMControl::Required) == PAMControl(PAMControl::Requisite));
}

TEST(PAMControlTest, BracketedControlsEqualWhenTheirTextsDo) {
  EXPECT_TRUE(PAMControl("[a]") == PAMControl("[a]"));
  EXPECT_FALSE(PAMControl("[a]") == PAMControl("[a ]"));
}

TEST(PAMControlTest, ABracketedControlEqualsNoKeyword) {
  const PAMControl bracketed(PAMControl::Bracketed, "required");
  const PAMControl keyword(PAMControl::Required, "required");
  EXPECT_FALSE(bracketed == keyword);
  EXPECT_FALSE(keyword == bracketed);
}

TEST(PAMControlTest, AKeywordComparesWithTheControlThatATextMeans) {
  EXPECT_TRUE(PAMControl(PAMControl::Include) == "include");
  EXPECT_FALSE(PAMControl(PAMControl::Include) == "substack");
  EXPECT_FALSE(PAMControl(PAMControl::Include) == "[include]");
}

TEST(PAMControlTest, AKeywordCannotBeComparedWithATextThatIsNoControl) {
  EXPECT_THROW_WHAT(PAMControl(PAMControl::Include) == "Include", InvalidControlException,
                    "Invalid Control: Include");
}

TEST(PAMControlTest, ABracketedControlComparesItsTextWithAnyText) {
  EXPECT_TRUE(PAMControl("[a]") == "[a]");
  EXPECT_FALSE(PAMControl("[a]") == "no control at all");
}

TEST(PAMControlTest, ComparesWithAnEnumeratorWithoutAmbiguity) {
  EXPECT_TRUE(PAMControl("required") == PAMControl::Required);
  EXPECT_TRUE(PAMControl("required") != PAMControl::Optional);
}

TEST(PAMControlTest, ConstantControlsCompareFromEitherSide) {
  const PAMControl control("required");
  const std::string text = "required";
  EXPECT_TRUE(control == text);
  EXPECT_TRUE(text == control);
  EXPECT_TRUE(PAMControl::Required == control);
}

TEST(PAMControlTest, UnsetHasNoKeyword) {
  EXPECT_THROW_WHAT(TextOf(PAMControl()), InvalidControlException, "Invalid Control: ");
}

TEST(PAMControlTest, AValueWithoutKeywordShortensItsMessageByItself) {
  EXPECT_THROW_WHAT(TextOf(FromNumber(8)), InvalidControlException, "Control: ");
  EXPECT_THROW_WHAT(TextOf(FromNumber(16)), InvalidControlException, " ");
}

TEST(PAMControlTest, AValueAsLargeAsTheMessageLeavesNothingOfIt) {
  EXPECT_THROW_WHAT(TextOf(FromNumber(17)), InvalidControlException, "");
}

TEST(PAMControlTest, AnyLargerValueStillThrows) {
  EXPECT_THROW(TextOf(FromNumber(18)), InvalidControlException);
  EXPECT_THROW(TextOf(FromNumber(0xffffffffU)), InvalidControlException);
}

}  // namespace
}  // namespace SystemConfiguration
