#include "config/key_value_parser.h"

#include <gtest/gtest.h>

#include <string>
#include <utility>

#include "authentication/library_exceptions.h"
#include "support/expect_throw_what.h"

namespace quenix::authentication {
namespace {

using Pair = std::pair<std::string, std::string>;

TEST(KeyValueParserTest, AnUnquotedLineWithoutBlanks) {
  EXPECT_EQ(GetKeyValuePair("a=b", 1), Pair("a", "b"));
}

TEST(KeyValueParserTest, BlanksAndTabsAroundBothPartsAreDropped) {
  EXPECT_EQ(GetKeyValuePair(" \t key \t=\t value \t", 1), Pair("key", "value"));
}

TEST(KeyValueParserTest, BlanksInsideAPartStay) {
  EXPECT_EQ(GetKeyValuePair("a key = a \t value", 1), Pair("a key", "a \t value"));
}

TEST(KeyValueParserTest, DoubleQuotesAreDropped) {
  EXPECT_EQ(GetKeyValuePair("key = \"value\"", 1), Pair("key", "value"));
}

TEST(KeyValueParserTest, SingleQuotesAreDroppedAndInnerBlanksStay) {
  EXPECT_EQ(GetKeyValuePair("key = ' a value '", 1), Pair("key", " a value "));
}

TEST(KeyValueParserTest, TheKeysQuotesAreDroppedToo) {
  EXPECT_EQ(GetKeyValuePair("\"key\" = value", 1), Pair("key", "value"));
  EXPECT_EQ(GetKeyValuePair("' key' = value", 1), Pair(" key", "value"));
}

TEST(KeyValueParserTest, TwoAdjacentQuotesAreEmpty) {
  EXPECT_EQ(GetKeyValuePair("key = \"\"", 1), Pair("key", ""));
  EXPECT_EQ(GetKeyValuePair("key = ''", 1), Pair("key", ""));
}

TEST(KeyValueParserTest, OnlyOnePairOfQuotesIsDropped) {
  EXPECT_EQ(GetKeyValuePair("key = \"\"value\"\"", 1), Pair("key", "\"value\""));
  EXPECT_EQ(GetKeyValuePair("key = \"'value'\"", 1), Pair("key", "'value'"));
}

TEST(KeyValueParserTest, QuotesAndBackslashesInsideStay) {
  EXPECT_EQ(GetKeyValuePair("key = \"a\\\"b\"", 1), Pair("key", "a\\\"b"));
}

TEST(KeyValueParserTest, AnOpeningQuoteAloneStays) {
  EXPECT_EQ(GetKeyValuePair("key = \"value", 1), Pair("key", "\"value"));
}

TEST(KeyValueParserTest, AClosingQuoteAloneStays) {
  EXPECT_EQ(GetKeyValuePair("key = value'", 1), Pair("key", "value'"));
}

TEST(KeyValueParserTest, MixedQuotesStay) {
  EXPECT_EQ(GetKeyValuePair("key = \"value'", 1), Pair("key", "\"value'"));
  EXPECT_EQ(GetKeyValuePair("key = 'value\"", 1), Pair("key", "'value\""));
}

TEST(KeyValueParserTest, TheSecondEqualsSignBelongsToTheValue) {
  EXPECT_EQ(GetKeyValuePair("key = a=b", 1), Pair("key", "a=b"));
  EXPECT_EQ(GetKeyValuePair("key==", 1), Pair("key", "="));
}

TEST(KeyValueParserTest, AnEmptyKeyIsAccepted) {
  EXPECT_EQ(GetKeyValuePair("=value", 1), Pair("", "value"));
}

TEST(KeyValueParserTest, AnEmptyValueIsAccepted) {
  EXPECT_EQ(GetKeyValuePair("key=", 1), Pair("key", ""));
}

TEST(KeyValueParserTest, APartOfBlanksOnlyStaysAsItIs) {
  EXPECT_EQ(GetKeyValuePair("key =   ", 1), Pair("key", "   "));
  EXPECT_EQ(GetKeyValuePair(" \t = value", 1), Pair(" \t ", "value"));
}

TEST(KeyValueParserTest, OneSignificantCharacterIsThatCharacter) {
  EXPECT_EQ(GetKeyValuePair(" k = v ", 1), Pair("k", "v"));
}

TEST(KeyValueParserTest, ACarriageReturnIsASignificantCharacter) {
  EXPECT_EQ(GetKeyValuePair("key = \"value\"\r", 1), Pair("key", "\"value\"\r"));
}

TEST(KeyValueParserTest, OtherWhiteSpaceIsNoBlank) {
  EXPECT_EQ(GetKeyValuePair("key = \vvalue\f", 1), Pair("key", "\vvalue\f"));
}

TEST(KeyValueParserTest, AZeroByteIsKept) {
  EXPECT_EQ(GetKeyValuePair(std::string("key = \"a\0b\"", 11), 1), Pair("key", std::string("a\0b", 3)));
}

TEST(KeyValueParserTest, ALineWithoutEqualsSignNamesItsLine) {
  EXPECT_THROW_WHAT(GetKeyValuePair("# comment", 12), ConfigurationError,
                    "Error parsing configuration on line 12: no delimiter found");
}

TEST(KeyValueParserTest, ALoneQuoteAsValueNamesItsLine) {
  EXPECT_THROW_WHAT(GetKeyValuePair("key = \"", 3), ConfigurationError,
                    "Error parsing configuration at line 3: invalid quoting");
  EXPECT_THROW_WHAT(GetKeyValuePair("key = '", 4), ConfigurationError,
                    "Error parsing configuration at line 4: invalid quoting");
}

TEST(KeyValueParserTest, ALoneQuoteAsKeyNamesItsLine) {
  EXPECT_THROW_WHAT(GetKeyValuePair(" ' = value", 5), ConfigurationError,
                    "Error parsing configuration at line 5: invalid quoting");
}

TEST(KeyValueParserTest, LargeLineNumbersAreNotGrouped) {
  EXPECT_THROW_WHAT(GetKeyValuePair("x", 1234567), ConfigurationError,
                    "Error parsing configuration on line 1234567: no delimiter found");
}

}  // namespace
}  // namespace quenix::authentication
