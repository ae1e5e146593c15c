#include <gtest/gtest.h>

#include <list>
#include <sstream>
#include <string>

#include "support/expect_throw_what.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::Written;
using Words = std::list<std::string>;

PAMEntry ReadEntry(const std::string& text) {
  std::istringstream stream(text);
  PAMEntry entry;
  stream >> entry;
  return entry;
}

TEST(PAMEntryTest, HasNothingWhenDefaultConstructed) {
  PAMEntry entry;
  EXPECT_EQ(entry.module(), "");
  EXPECT_TRUE(entry.parameters().empty());
  EXPECT_THROW_WHAT(Written(entry), InvalidControlException, "Invalid Control: ");
}

TEST(PAMEntryTest, HasNoParametersWhenMadeFromControlAndModule) {
  PAMEntry entry(PAMControl::Required, "pam_unix.so");
  EXPECT_EQ(entry.module(), "pam_unix.so");
  EXPECT_TRUE(entry.parameters().empty());
}

TEST(PAMEntryTest, ParametersAreChangedInPlace) {
  PAMEntry entry(PAMControl::Required, "pam_unix.so");
  entry.parameters().push_back("nullok");
  EXPECT_EQ(Written(entry), "required\tpam_unix.so\tnullok ");
}

TEST(PAMEntryTest, AnEntryWithoutParametersEndsWithATab) {
  EXPECT_EQ(Written(PAMEntry(PAMControl::Required, "pam_unix.so")), "required\tpam_unix.so\t");
}

TEST(PAMEntryTest, AnEntryWithParametersEndsWithABlank) {
  PAMEntry entry(PAMControl("[default=die]"), "pam_x.so");
  entry.parameters() = {"a", "b"};
  EXPECT_EQ(Written(entry), "[default=die]\tpam_x.so\ta b ");
}

TEST(PAMEntryTest, ABracketedControlWithoutTextIsWrittenAsNothing) {
  EXPECT_EQ(Written(PAMEntry(PAMControl::Bracketed, "m")), "\tm\t");
}

TEST(PAMEntryTest, WritingWithoutControlThrowsAndWritesNothing) {
  std::ostringstream stream;
  EXPECT_THROW_WHAT(stream << PAMEntry(), InvalidControlException, "Invalid Control: ");
  EXPECT_EQ(stream.str(), "");
}

TEST(PAMEntryTest, IsReadFromControlModuleAndTheRestOfTheLine) {
  PAMEntry entry = ReadEntry("  required \t pam_x.so  a\t b \nnext");
  EXPECT_EQ(entry.module(), "pam_x.so");
  EXPECT_EQ(entry.parameters(), (Words{"a", "b"}));
}

TEST(PAMEntryTest, ReadingStopsBehindTheLineEnd) {
  std::istringstream stream("required pam_x.so a\nnext");
  PAMEntry entry;
  stream >> entry;
  EXPECT_EQ(stream.tellg(), 20);
}

TEST(PAMEntryTest, ABracketedControlOfSeveralWordsGetsSingleBlanks) {
  EXPECT_EQ(Written(ReadEntry("[success=ok  \t default=die ] m\n")), "[success=ok default=die ]\tm\t");
}

TEST(PAMEntryTest, ABracketedControlMayCrossLineEnds) {
  EXPECT_EQ(Written(ReadEntry("[success=ok\ndefault=die]\nm a\n")), "[success=ok default=die]\tm\ta ");
}

TEST(PAMEntryTest, ABracketThatClosesInItsOwnWordNeedsNoOther) {
  EXPECT_EQ(Written(ReadEntry("[default=die] [m] a]\n")), "[default=die]\t[m]\ta] ");
}

TEST(PAMEntryTest, ABracketInsideAWordDoesNotClose) {
  EXPECT_EQ(Written(ReadEntry("[a]b c] m\n")), "[a]b c]\tm\t");
}

TEST(PAMEntryTest, AnUnclosedBracketThrowsWithAllThatFollowed) {
  EXPECT_THROW_WHAT(ReadEntry("[success=ok  pam_x.so\n auth"), InvalidControlException,
                    "Invalid Control: [success=ok pam_x.so auth");
}

TEST(PAMEntryTest, AnUnknownControlThrows) {
  EXPECT_THROW_WHAT(ReadEntry("Required pam_x.so\n"), InvalidControlException, "Invalid Control: Required");
}

TEST(PAMEntryTest, AMissingControlThrows) {
  EXPECT_THROW_WHAT(ReadEntry(" \n"), InvalidControlException, "Invalid Control: ");
}

TEST(PAMEntryTest, AMissingModuleIsTakenFromTheNextLine) {
  PAMEntry entry = ReadEntry("required\npam_y.so arg\n");
  EXPECT_EQ(entry.module(), "pam_y.so");
  EXPECT_EQ(entry.parameters(), Words{"arg"});
}

TEST(PAMEntryTest, ANumberSignInTheLineIsAParameter) {
  EXPECT_EQ(ReadEntry("required m a # why\n").parameters(), (Words{"a", "#", "why"}));
}

TEST(PAMEntryTest, QuotesBracketsAndBackslashesDoNotHoldParametersTogether) {
  EXPECT_EQ(ReadEntry("required m [a b] 'c d' e\\ f \\\n").parameters(),
            (Words{"[a", "b]", "'c", "d'", "e\\", "f", "\\"}));
}

TEST(PAMEntryTest, ACarriageReturnIsWhiteSpace) {
  EXPECT_EQ(ReadEntry("required m a\r\n").parameters(), Words{"a"});
}

TEST(PAMEntryTest, ParametersAreAppendedToThoseThatItHas) {
  PAMEntry entry(PAMControl::Optional, "old");
  entry.parameters() = {"old1", "old2"};
  std::istringstream stream("required new fresh\n");
  stream >> entry;
  EXPECT_EQ(Written(entry), "required\tnew\told1 old2 fresh ");
}

TEST(PAMEntryTest, ReadingAKeywordForgetsAnEarlierBracketedText) {
  PAMEntry entry(PAMControl("[old]"), "m");
  std::istringstream stream("[new] m\n");
  stream >> entry;
  EXPECT_EQ(Written(entry), "[new]\tm\t");
}

TEST(PAMEntryTest, IsUnchangedWhenTheControlIsUnknown) {
  PAMEntry entry(PAMControl::Optional, "old");
  std::istringstream stream("wrong new fresh\n");
  EXPECT_THROW(stream >> entry, InvalidControlException);
  EXPECT_EQ(Written(entry), "optional\told\t");
}

TEST(PAMEntryTest, EqualsAnEntryWithTheSameParts) {
  EXPECT_TRUE(ReadEntry("required m a b\n") == ReadEntry("required  m\ta\tb\n"));
}

TEST(PAMEntryTest, DiffersInControlModuleNumberOrOrderOfParameters) {
  const PAMEntry entry = ReadEntry("required m a b\n");
  EXPECT_FALSE(entry == ReadEntry("optional m a b\n"));
  EXPECT_FALSE(entry == ReadEntry("required M a b\n"));
  EXPECT_FALSE(entry == ReadEntry("required m a\n"));
  EXPECT_FALSE(entry == ReadEntry("required m b a\n"));
}

TEST(PAMEntryTest, BracketedControlsCountAsEqualWhateverTheirTexts) {
  EXPECT_TRUE(ReadEntry("[success=1] m a\n") == ReadEntry("[default=die] m a\n"));
  EXPECT_FALSE(ReadEntry("[success=1] m a\n") == ReadEntry("required m a\n"));
}

}  // namespace
}  // namespace SystemConfiguration
