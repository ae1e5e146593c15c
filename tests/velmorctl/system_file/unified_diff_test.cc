#include "system_file/unified_diff.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>

#include "support/files.h"
#include "text.h"
#include "tool.h"

namespace velmorctltest {

namespace {

using velmorctl::UnifiedDiff;

struct Texts {
  const char* name;
  std::string before;
  std::string after;
};

std::string Numbered(int first, int last) {
  std::string text;
  for (int number = first; number <= last; ++number) {
    text += "line " + std::to_string(number) + "\n";
  }
  return text;
}

/// What diff(1) says of the two texts.
std::string DiffOfTheSystem(const std::string& folder, const Texts& texts) {
  testsupport::WriteFile(folder + "before", texts.before);
  testsupport::WriteFile(folder + "after", texts.after);
  return RunTool(
             {"diff", "-u", "--label", "a/file", "--label", "b/file", folder + "before", folder + "after"})
      .output;
}

class UnifiedDiffTest : public ::testing::TestWithParam<Texts> {};

TEST_P(UnifiedDiffTest, IsWhatTheSystemsToolSays) {
  const testsupport::ScratchFolder folder;
  EXPECT_EQ(UnifiedDiff("/file", GetParam().before, GetParam().after),
            DiffOfTheSystem(folder.Path(), GetParam()));
}

INSTANTIATE_TEST_SUITE_P(
    Each, UnifiedDiffTest,
    ::testing::Values(
        Texts{"EqualTexts", "a\nb\n", "a\nb\n"}, Texts{"FirstLine", "a\nb\nc\nd\ne\n", "x\nb\nc\nd\ne\n"},
        Texts{"LastLine", "a\nb\nc\nd\ne\n", "a\nb\nc\nd\nx\n"}, Texts{"OnlyLine", "a\n", "b\n"},
        Texts{"LineAdded", "a\nb\n", "a\nx\nb\n"},
        Texts{"LineAddedAtTheEnd", Numbered(1, 9), Numbered(1, 10)},
        Texts{"LineRemoved", "a\nb\nc\n", "a\nc\n"}, Texts{"FromNothing", "", "a\nb\n"},
        Texts{"ToNothing", "a\nb\n", ""}, Texts{"NoNewlineBefore", "a\nb", "a\nb\n"},
        Texts{"NoNewlineAfter", "a\nb\n", "a\nb"}, Texts{"NoNewlineInContext", "a\nb\nc", "x\nb\nc"},
        Texts{"NoNewlineOnBothSides", "a\nb", "a\nc"}, Texts{"CarriageReturns", "a\r\nb\r\n", "a\r\nc\r\n"},
        Texts{"TwoHunks", Numbered(1, 20), "x\n" + Numbered(2, 19) + "y\n"},
        Texts{"ContextsThatTouch", Numbered(1, 9), "x\n" + Numbered(2, 7) + "y\n" + Numbered(9, 9)},
        Texts{"ContextsThatDoNotTouch", Numbered(1, 10), "x\n" + Numbered(2, 8) + "y\n" + Numbered(10, 10)},
        Texts{"EqualLines", "a\na\na\n", "a\na\na\na\n"}),
    [](const auto& test) { return std::string(test.param.name); });

TEST(UnifiedDiffOfMissingFilesTest, NamesTheNullDevice) {
  EXPECT_EQ(UnifiedDiff("/file", std::nullopt, "a\n"), "--- /dev/null\n+++ b/file\n@@ -0,0 +1 @@\n+a\n");
  EXPECT_EQ(UnifiedDiff("/file", "a\n", std::nullopt), "--- a/file\n+++ /dev/null\n@@ -1 +0,0 @@\n-a\n");
}

TEST(UnifiedDiffOfOddNamesTest, ForgesNoLines) {
  EXPECT_EQ(UnifiedDiff("/file\n+++ b/other", "a\n", std::nullopt),
            "--- a/file?+++ b/other\n+++ /dev/null\n@@ -1 +0,0 @@\n-a\n");
}

/// A text of a few different lines, many of them equal, with or without a newline at its end.
std::string RandomText(std::mt19937& random) {
  std::string text;
  for (auto lines = random() % 12; lines > 0; --lines) {
    text += std::string(1, static_cast<char>('a' + random() % 4)) + "\n";
  }
  if (!text.empty() && random() % 4 == 0) {
    text.pop_back();
  }
  return text;
}

void ExpectPatchMakes(const std::string& folder, const Texts& texts) {
  testsupport::WriteFile(folder + "file", texts.before);
  testsupport::WriteFile(folder + "patch", UnifiedDiff("/file", texts.before, texts.after));
  const ToolOutcome outcome =
      RunTool({"patch", "-s", "-p1", "--binary", "-d", folder, "-i", folder + "patch", folder + "file"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
  EXPECT_EQ(testsupport::ReadFile(folder + "file"), texts.after) << texts.before;
}

TEST(UnifiedDiffOfRandomTextsTest, IsTakenByPatch) {
  std::mt19937 random(4711);  // NOLINT(cert-msc51-cpp): the same texts each time
  const testsupport::ScratchFolder folder;
  for (int count = 0; count < 200; ++count) {
    const Texts texts = {"", RandomText(random), RandomText(random)};
    if (!texts.after.empty() && texts.before != texts.after) {
      ExpectPatchMakes(folder.Path(), texts);
    }
  }
}

std::ptrdiff_t ChangedLines(const std::string& diff) {
  std::ptrdiff_t changed = 0;
  for (std::size_t line = 0; line < diff.size(); line = diff.find('\n', line) + 1) {
    changed += diff[line] == '+' || diff[line] == '-' ? 1 : 0;
  }
  return changed;
}

TEST(UnifiedDiffOfRandomTextsTest, ChangesNoMoreLinesThanTheSystemsTool) {
  std::mt19937 random(815);  // NOLINT(cert-msc51-cpp): the same texts each time
  const testsupport::ScratchFolder folder;
  for (int count = 0; count < 200; ++count) {
    const Texts texts = {"", RandomText(random), RandomText(random)};
    EXPECT_LE(ChangedLines(UnifiedDiff("/file", texts.before, texts.after)),
              ChangedLines(DiffOfTheSystem(folder.Path(), texts)))
        << texts.before << "--\n"
        << texts.after;
  }
}

TEST(UnifiedDiffOfGreatTextsTest, IsTakenByPatch) {
  const testsupport::ScratchFolder folder;
  ExpectPatchMakes(folder.Path(), {"", Numbered(1, 3000), Numbered(1000, 1001) + Numbered(5000, 9000)});
}

TEST(PrintableLinesTest, ShowsControlCharactersAsLetters) {
  EXPECT_EQ(velmorctl::PrintableLines("a\tb\r\n\x1b[31m\x7f\n"), "a\tb^M\n^[[31m^?\n");
}

TEST(PrintableLinesTest, HidesControlCharactersOfTheSecondSet) {
  EXPECT_EQ(velmorctl::PrintableLines("a\xc2\x9b"
                                      "31m"),
            "a^?31m");
}

TEST(PrintableTest, HidesControlCharactersOfBothSets) {
  EXPECT_EQ(velmorctl::Printable("a\x1b\n\x7f\xc2\x80\xc2\x9f.\xc2\xa0\xc2"),
            "a????"
            "?.\xc2\xa0\xc2");
}

TEST(PrintableLinesTest, LeavesOtherLetters) {
  EXPECT_EQ(velmorctl::PrintableLines("gr\xc3\xbc\xc3\x9f \xc2\xb5\n"), "gr\xc3\xbc\xc3\x9f \xc2\xb5\n");
}

}  // namespace

}  // namespace velmorctltest
