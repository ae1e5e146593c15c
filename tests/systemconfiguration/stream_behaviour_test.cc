#include <gtest/gtest.h>

#include <ios>
#include <list>
#include <locale>
#include <sstream>
#include <string>

#include "support/expect_throw_what.h"
#include "systemconfiguration/differential/test_streams.h"
#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using differential::BufferFault;
using differential::CommaLocale;
using differential::InputCase;
using differential::SinkBuffer;
using differential::SourceBuffer;
using testsupport::Written;

constexpr std::ios_base::iostate eof = std::ios_base::eofbit;
constexpr std::ios_base::iostate eofAndFail = std::ios_base::eofbit | std::ios_base::failbit;

std::ios_base::iostate StateAfterPolicy(const std::string& text) {
  std::istringstream stream(text);
  PAMPolicy policy("test");
  stream >> policy;
  return stream.rdstate();
}

// What one operation wrote, with "<flush>" wherever it flushed.
template <class Model>
std::string FlushLog(const Model& model) {
  const InputCase everythingFits;
  SinkBuffer buffer(everythingFits);
  std::ostream stream(&buffer);
  stream << model;
  return buffer.Log();
}

TEST(PolicyStreamTest, AFileThatEndsWithItsLastLineReachesTheEndWithoutFailing) {
  EXPECT_EQ(StateAfterPolicy("auth required m\n"), eof);
  EXPECT_EQ(StateAfterPolicy("auth required m a\n\n \t\n"), eof);
  EXPECT_EQ(StateAfterPolicy("# comment\n"), eof);
}

TEST(PolicyStreamTest, AnEmptyInputReachesTheEndWithoutFailing) {
  EXPECT_EQ(StateAfterPolicy(""), eof);
  EXPECT_EQ(StateAfterPolicy(" \n"), eof);
}

TEST(PolicyStreamTest, AMissingLastLineEndMakesTheStreamFail) {
  EXPECT_EQ(StateAfterPolicy("auth required m a"), eofAndFail);
  EXPECT_EQ(StateAfterPolicy("auth required m"), eofAndFail);
  EXPECT_EQ(StateAfterPolicy("auth required m\n# comment"), eofAndFail);
}

TEST(PolicyStreamTest, AMissingLastLineEndLosesNoEntry) {
  PAMPolicy policy = testsupport::ReadPolicy("auth required m\nauth required n a");
  EXPECT_EQ(Written(policy[PAMFacility::Auth]), "auth\trequired\tm\t\nauth\trequired\tn\ta \n");
}

TEST(PolicyStreamTest, AFailedStreamIsLeftAlone) {
  for (const std::ios_base::iostate state : {std::ios_base::failbit, std::ios_base::badbit}) {
    std::istringstream stream("auth required m\n");
    stream.clear(state);
    PAMPolicy policy("test");
    stream >> policy;
    EXPECT_EQ(stream.rdstate(), state);
    EXPECT_EQ(Written(policy), "#%PAM-1.0\n\n");
  }
}

TEST(PolicyStreamTest, AStreamAtItsEndFailsWithoutBeingRead) {
  std::istringstream stream("auth required m\n");
  stream.clear(std::ios_base::eofbit);
  PAMPolicy policy("test");
  stream >> policy;
  EXPECT_EQ(stream.rdstate(), eofAndFail);
  EXPECT_TRUE(policy[PAMFacility::Auth].empty());
}

TEST(PolicyStreamTest, AWidthCutsTheFirstWordOnly) {
  std::istringstream stream("authority required m\n");
  stream.width(4);
  PAMPolicy policy("test");
  EXPECT_THROW_WHAT(stream >> policy, InvalidControlException, "Invalid Control: ority");
  EXPECT_EQ(stream.width(), 0);
}

TEST(PolicyStreamTest, WithoutSkippingTheBlankBehindTheFacilityIsAnEmptyControl) {
  std::istringstream stream("auth required m\n");
  stream >> std::noskipws;
  PAMPolicy policy("test");
  EXPECT_THROW_WHAT(stream >> policy, InvalidControlException, "Invalid Control: ");
  EXPECT_TRUE(stream.fail());
}

TEST(PolicyStreamTest, AnExceptionMaskThrowsAtTheEndAndKeepsTheEntries) {
  std::istringstream stream("auth required m\n");
  stream.exceptions(std::ios_base::eofbit);
  PAMPolicy policy("test");
  EXPECT_THROW(stream >> policy, std::ios_base::failure);
  EXPECT_EQ(policy[PAMFacility::Auth].size(), 1U);
}

TEST(PolicyStreamTest, AnExceptionMaskForFailuresIsQuietOnAWholeFile) {
  std::istringstream stream("auth required m\n");
  stream.exceptions(std::ios_base::failbit | std::ios_base::badbit);
  PAMPolicy policy("test");
  EXPECT_NO_THROW(stream >> policy);
}

TEST(PolicyStreamTest, AnImbuedLocaleSeparatesFacilityControlAndModule) {
  std::istringstream stream("auth,required,the module,a\n");
  stream.imbue(CommaLocale());
  PAMPolicy policy("test");
  stream >> policy;
  EXPECT_EQ(policy[PAMFacility::Auth].front().module(), "the module");
  EXPECT_EQ(policy[PAMFacility::Auth].front().parameters(), std::list<std::string>{",a"});
}

TEST(PolicyStreamTest, ParametersAreSeparatedByTheGlobalLocale) {
  const std::locale before = std::locale::global(CommaLocale());
  std::istringstream stream("auth required m,a,b c\n");
  stream.imbue(std::locale::classic());
  PAMPolicy policy("test");
  stream >> policy;
  std::locale::global(before);
  EXPECT_EQ(policy[PAMFacility::Auth].front().module(), "m,a,b");
  EXPECT_EQ(policy[PAMFacility::Auth].front().parameters(), std::list<std::string>{" c"});
}

TEST(PolicyStreamTest, ABrokenSourceMakesTheStreamBad) {
  InputCase input;
  input.text = "auth required m\nauth required n\n";
  input.fault = 20;
  SourceBuffer buffer(input);
  std::istream stream(&buffer);
  PAMPolicy policy("test");
  EXPECT_THROW_WHAT(stream >> policy, InvalidControlException, "Invalid Control: ");
  EXPECT_TRUE(stream.bad());
  EXPECT_EQ(policy[PAMFacility::Auth].size(), 1U);
}

TEST(PolicyStreamTest, ABrokenSourcesExceptionComesThroughWhenAskedFor) {
  InputCase input;
  input.text = "auth required m\n";
  input.fault = 16;
  SourceBuffer buffer(input);
  std::istream stream(&buffer);
  stream.exceptions(std::ios_base::badbit);
  PAMPolicy policy("test");
  EXPECT_THROW_WHAT(stream >> policy, BufferFault, "the source is broken");
  EXPECT_EQ(policy[PAMFacility::Auth].size(), 1U);
}

TEST(PolicyStreamTest, EveryWrittenLineIsFlushed) {
  EXPECT_EQ(FlushLog(testsupport::ReadPolicy("auth required m a\nauth required n\n")),
            "#%PAM-1.0\n<flush>\n<flush>"
            "auth\trequired\tm\ta \n<flush>auth\trequired\tn\t\n<flush>\n<flush>");
}

TEST(PolicyStreamTest, AnEntryIsNotFlushed) {
  EXPECT_EQ(FlushLog(PAMEntry(PAMControl::Required, "m")), "required\tm\t");
}

TEST(PolicyStreamTest, AWidthPadsTheFirstWordOnly) {
  std::ostringstream stream;
  stream.width(12);
  stream << PAMEntry(PAMControl::Required, "m");
  EXPECT_EQ(stream.str(), "    required\tm\t");
  EXPECT_EQ(stream.width(), 0);
}

TEST(PolicyStreamTest, AWidthPadsTheHeader) {
  std::ostringstream stream;
  stream.width(12);
  stream << std::left << PAMPolicy("test");
  EXPECT_EQ(stream.str(), "#%PAM-1.0   \n\n");
}

TEST(PolicyStreamTest, AWidthPadsAFacility) {
  std::ostringstream stream;
  stream.width(6);
  stream << PAMFacility(PAMFacility::Auth);
  EXPECT_EQ(stream.str(), "  auth");
}

TEST(PolicyStreamTest, AFailedStreamTakesNothing) {
  std::ostringstream stream;
  stream.setstate(std::ios_base::failbit);
  stream << testsupport::ReadPolicy("auth required m\n");
  EXPECT_EQ(stream.str(), "");
}

TEST(PolicyStreamTest, AFullSinkMakesTheStreamBadAndKeepsWhatFitted) {
  InputCase room;
  room.capacity = 15;
  SinkBuffer buffer(room);
  std::ostream stream(&buffer);
  stream << testsupport::ReadPolicy("auth required m\n");
  EXPECT_TRUE(stream.bad());
  EXPECT_EQ(buffer.Log(), "#%PAM-1.0\n<flush>\n<flush>auth");
}

TEST(PolicyStreamTest, AFullSinkThrowsWhenAskedTo) {
  InputCase room;
  room.capacity = 15;
  SinkBuffer buffer(room);
  std::ostream stream(&buffer);
  stream.exceptions(std::ios_base::badbit);
  EXPECT_THROW(stream << testsupport::ReadPolicy("auth required m\n"), std::ios_base::failure);
}

TEST(EntryStreamTest, AWidthCutsTheControl) {
  std::istringstream stream("required m\n");
  stream.width(3);
  PAMEntry entry;
  EXPECT_THROW_WHAT(stream >> entry, InvalidControlException, "Invalid Control: req");
}

TEST(EntryStreamTest, AModuleThatIsMissingAtTheEndLeavesTheOldOne) {
  PAMEntry entry(PAMControl::Optional, "old");
  std::istringstream stream("required");
  stream >> entry;
  EXPECT_EQ(Written(entry), "required\told\t");
  EXPECT_EQ(stream.rdstate(), eofAndFail);
}

TEST(EntryStreamTest, AFailedStreamHasNoControl) {
  std::istringstream stream("required m\n");
  stream.setstate(std::ios_base::failbit);
  PAMEntry entry;
  EXPECT_THROW_WHAT(stream >> entry, InvalidControlException, "Invalid Control: ");
}

TEST(EntryStreamTest, AnEntryWithItsLineEndLeavesTheStreamGood) {
  std::istringstream stream("required m a\n");
  PAMEntry entry;
  stream >> entry;
  EXPECT_TRUE(stream.good());
}

TEST(ConfigurationStreamTest, ReadingEndsAsALoopOverLinesDoes) {
  for (const std::string text : {"", "passwd: files\n", "passwd: files"}) {
    std::istringstream stream(text);
    NSSConfiguration configuration;
    stream >> configuration;
    EXPECT_EQ(stream.rdstate(), eofAndFail) << text;
  }
}

TEST(ConfigurationStreamTest, AFailedStreamIsLeftAlone) {
  for (const std::ios_base::iostate state : {std::ios_base::failbit, std::ios_base::badbit}) {
    std::istringstream stream("passwd: files\n");
    stream.clear(state);
    NSSConfiguration configuration;
    stream >> configuration;
    EXPECT_EQ(stream.rdstate(), state);
    EXPECT_EQ(Written(configuration), "");
  }
}

TEST(ConfigurationStreamTest, WidthAndSkippingDoNotMatterToReading) {
  std::istringstream stream("passwd:  files\n");
  stream.width(3);
  stream >> std::noskipws;
  NSSConfiguration configuration;
  stream >> configuration;
  EXPECT_EQ(Written(configuration), "passwd: files\n");
  EXPECT_EQ(stream.width(), 3);
}

TEST(ConfigurationStreamTest, AnExceptionMaskThrowsAtTheEndAndKeepsTheServices) {
  std::istringstream stream("passwd: files\n");
  stream.exceptions(std::ios_base::failbit);
  NSSConfiguration configuration;
  EXPECT_THROW(stream >> configuration, std::ios_base::failure);
  EXPECT_EQ(Written(configuration), "passwd: files\n");
}

TEST(ConfigurationStreamTest, AnImbuedLocaleDoesNotSeparateServices) {
  std::istringstream stream("passwd: files,nis x\n");
  stream.imbue(CommaLocale());
  NSSConfiguration configuration;
  stream >> configuration;
  EXPECT_EQ(Written(configuration), "passwd: files,nis x\n");
}

TEST(ConfigurationStreamTest, TheGlobalLocaleSeparatesServices) {
  const std::locale before = std::locale::global(CommaLocale());
  std::istringstream stream("passwd:,files,nis x\n");
  NSSConfiguration configuration;
  stream >> configuration;
  std::locale::global(before);
  ASSERT_EQ(configuration[NSSDatabase::Passwd].size(), 2U);
  EXPECT_EQ(configuration[NSSDatabase::Passwd][1].module(), "nis x");
}

TEST(ConfigurationStreamTest, ABrokenSourceMakesTheStreamBadAndKeepsTheServices) {
  InputCase input;
  input.text = "passwd: files\ngroup: files\n";
  input.fault = 20;
  SourceBuffer buffer(input);
  std::istream stream(&buffer);
  NSSConfiguration configuration;
  stream >> configuration;
  EXPECT_TRUE(stream.bad());
  EXPECT_EQ(Written(configuration), "passwd: files\n");
}

TEST(ConfigurationStreamTest, EveryWrittenLineIsFlushed) {
  EXPECT_EQ(FlushLog(testsupport::ReadConfiguration("passwd: files nis\ngroup: files\n")),
            "passwd: files nis\n<flush>group: files\n<flush>");
}

TEST(ConfigurationStreamTest, AWidthPadsTheFirstWordOnly) {
  std::ostringstream stream;
  stream.width(8);
  stream << testsupport::ReadConfiguration("passwd: files nis\n");
  EXPECT_EQ(stream.str(), "  passwd: files nis\n");
}

TEST(ConfigurationStreamTest, AFullSinkMakesTheStreamBadAndKeepsWhatFitted) {
  InputCase room;
  room.capacity = 10;
  SinkBuffer buffer(room);
  std::ostream stream(&buffer);
  stream << testsupport::ReadConfiguration("passwd: files nis\n");
  EXPECT_TRUE(stream.bad());
  EXPECT_EQ(buffer.Log(), "passwd: fi");
}

}  // namespace
}  // namespace SystemConfiguration
