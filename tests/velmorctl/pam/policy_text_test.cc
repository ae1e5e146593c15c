#include "pam/policy_text.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace velmorctltest {

namespace {

using velmorctl::pam::LogicalLine;
using velmorctl::pam::PolicyText;

std::vector<std::string> Texts(const PolicyText& text) {
  std::vector<std::string> texts;
  for (const LogicalLine& line : text.Lines()) {
    texts.push_back(line.text);
  }
  return texts;
}

struct KeptText {
  const char* name;
  std::string content;
};

class KeptTextTest : public ::testing::TestWithParam<KeptText> {};

TEST_P(KeptTextTest, KeepsEveryByte) {
  EXPECT_EQ(PolicyText(GetParam().content).Content(), GetParam().content);
}

INSTANTIATE_TEST_SUITE_P(Each, KeptTextTest,
                         ::testing::Values(KeptText{"Nothing", ""}, KeptText{"Newline", "\n"},
                                           KeptText{"NoNewlineAtTheEnd", "a\nb"},
                                           KeptText{"CarriageReturns", "a\r\nb\r\n\r"},
                                           KeptText{"NullBytes", std::string("a\0\nb\0", 5)},
                                           KeptText{"LongLine", std::string(5000, 'x') + "\n#"}),
                         [](const ::testing::TestParamInfo<KeptText>& kept) { return kept.param.name; });

TEST(PolicyTextTest, BlankLinesAndCommentsAreNoLines) {
  PolicyText text("\n  \t\n# a\n  # b\nauth required x # c\n");
  EXPECT_EQ(Texts(text), std::vector<std::string>{"auth required x "});
  EXPECT_EQ(text.Lines()[0].firstLine, 5U);
  EXPECT_EQ(text.Lines()[0].lastLine, 5U);
}

TEST(PolicyTextTest, ABackslashJoinsLinesOverBlankOnesAndComments) {
  PolicyText text("auth \\\n\n# between\nrequired \\ \nx\nnext");
  EXPECT_EQ(Texts(text), (std::vector<std::string>{"auth  required  x\n", "next"}));
  EXPECT_EQ(text.Lines()[0].firstLine, 1U);
  EXPECT_EQ(text.Lines()[0].lastLine, 5U);
  EXPECT_EQ(text.Lines()[1].firstLine, 6U);
}

TEST(PolicyTextTest, ALineOf1023BytesIsWhole) {
  PolicyText text(std::string(1023, 'x') + "\n");
  ASSERT_EQ(text.Lines().size(), 1U);
  EXPECT_FALSE(text.Lines()[0].cut);
}

TEST(PolicyTextTest, ALongerLineIsCut) {
  PolicyText text(std::string(1024, 'x') + "\nend\n");
  ASSERT_EQ(text.Lines().size(), 3U);
  EXPECT_TRUE(text.Lines()[0].cut);
  EXPECT_TRUE(text.Lines()[1].cut);
  EXPECT_EQ(text.Lines()[1].text, "x\n");
  EXPECT_FALSE(text.Lines()[2].cut);
}

TEST(PolicyTextTest, TheRestOfALongCommentIsALine) {
  PolicyText text("#" + std::string(1022, 'x') + "rest\n");
  ASSERT_EQ(Texts(text), std::vector<std::string>{"rest\n"});
  EXPECT_TRUE(text.Lines()[0].cut);
}

TEST(PolicyTextTest, ABackslashInTheLastLineLeavesTheFileUnfinished) {
  PolicyText text("a\nb \\\n");
  EXPECT_EQ(text.HowItEnds(), PolicyText::End::Unfinished);
  EXPECT_EQ(text.EndLine(), 2U);
  EXPECT_EQ(Texts(text), std::vector<std::string>{"a\n"});
}

TEST(PolicyTextTest, ABackslashAtTheEndOfTheBufferIsReadForEver) {
  PolicyText text("a\n" + std::string(1022, 'x') + "\\\nb\n");
  EXPECT_EQ(text.HowItEnds(), PolicyText::End::Endless);
  EXPECT_EQ(text.EndLine(), 2U);
}

TEST(PolicyTextTest, InsertsBeforeAndAfterALine) {
  PolicyText text("# head\nb \\\n c\nd\n");
  text.InsertBefore(0, "a");
  text.InsertAfter(1, "x");
  EXPECT_EQ(text.Content(), "# head\na\nb \\\n c\nx\nd\n");
}

TEST(PolicyTextTest, ReplacesAndRemovesAContinuedLineAsAWhole) {
  PolicyText text("a\nb \\\n c\nd\n");
  text.Replace(1, "e");
  EXPECT_EQ(text.Content(), "a\ne\nd\n");
  text.Remove(0);
  EXPECT_EQ(text.Content(), "e\nd\n");
}

TEST(PolicyTextTest, NewLinesEndAsTheFirstOne) {
  PolicyText text("a\r\nb\r\n");
  text.InsertAfter(0, "x");
  EXPECT_EQ(text.Content(), "a\r\nx\r\nb\r\n");
}

TEST(PolicyTextTest, ALastLineWithoutNewlineGetsOneBeforeAnother) {
  PolicyText text("a\nb");
  text.InsertAfter(1, "c");
  EXPECT_EQ(text.Content(), "a\nb\nc\n");
}

TEST(PolicyTextTest, AReplacedLastLineStaysWithoutNewline) {
  PolicyText text("a\nb");
  text.Replace(1, "c");
  EXPECT_EQ(text.Content(), "a\nc");
}

TEST(PolicyTextTest, AppendsToAnEmptyFile) {
  PolicyText text("");
  text.Append("a");
  text.Append("b");
  EXPECT_EQ(text.Content(), "a\nb\n");
  EXPECT_EQ(text.Lines().size(), 2U);
}

TEST(PolicyTextTest, RefusesToEditACutLine) {
  PolicyText text(std::string(1500, 'x') + "\n");
  EXPECT_THROW(text.Remove(0), std::invalid_argument);
  EXPECT_THROW(text.InsertBefore(2, "a"), std::invalid_argument);
}

}  // namespace

}  // namespace velmorctltest
