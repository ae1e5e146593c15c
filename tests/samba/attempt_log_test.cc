// The record of attempts.

#include "common/attempt_log.h"

#include <gtest/gtest.h>

#include <nlohmann/json.hpp>
#include <sstream>
#include <vector>

#include "common/status.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

const std::string RECORD = "/var/lib/quenix/samba/attempts.log";

std::vector<nlohmann::json> Lines() {
  std::vector<nlohmann::json> lines;
  std::istringstream text(testsupport::ReadFile(RECORD));
  for (std::string line; std::getline(text, line);) lines.push_back(nlohmann::json::parse(line));
  return lines;
}

class AttemptLogTest : public testing::Test {
 protected:
  AttemptLogTest() { testsupport::MakeFolders("/var/lib/quenix/samba"); }
  const AttemptLog log_{4711, "join"};
};

TEST_F(AttemptLogTest, ALineHasTheDocumentedFields) {
  EXPECT_EQ(
      FormatAttemptLine("2026-11-21T01:20:03.125Z", 4711, "join", "password", "end", 86, "refused"),
      "{\"time\":\"2026-11-21T01:20:03.125Z\",\"process\":4711,\"operation\":\"join\",\"step\":\"password\","
      "\"event\":\"end\",\"status\":86,\"text\":\"refused\"}\n");
}

TEST_F(AttemptLogTest, ALineEndInATextDoesNotEndTheLine) {
  log_.Note("undo", "one\ntwo");
  ASSERT_EQ(Lines().size(), 1U);
  EXPECT_EQ(Lines()[0]["text"], "one\ntwo");
}

TEST_F(AttemptLogTest, BytesThatAreNotUtf8AreReplaced) {
  log_.Note("undo",
            "a\xff"
            "b");
  EXPECT_EQ(Lines().at(0)["text"],
            "a\xef\xbf\xbd"
            "b");
}

TEST_F(AttemptLogTest, AStepThatWorksIsRecordedWithItsResult) {
  log_.Run("locate", "asking", [] { return "found"; });
  ASSERT_EQ(Lines().size(), 2U);
  EXPECT_EQ(Lines()[0]["event"], "begin");
  EXPECT_EQ(Lines()[0]["text"], "asking");
  EXPECT_EQ(Lines()[1]["event"], "end");
  EXPECT_EQ(Lines()[1]["status"], 0);
  EXPECT_EQ(Lines()[1]["text"], "found");
}

TEST_F(AttemptLogTest, AStepThatFailsIsRecordedAndItsFailurePassedOn) {
  EXPECT_THROW(log_.Run("locate", "asking", []() -> std::string { throw Failure(1355, "unknown"); }),
               Failure);
  ASSERT_EQ(Lines().size(), 2U);
  EXPECT_EQ(Lines()[1]["status"], 1355);
  EXPECT_EQ(Lines()[1]["text"], "unknown");
}

TEST_F(AttemptLogTest, OnlyRootMayReadIt) {
  log_.Note("undo", "x");
  EXPECT_EQ(testsupport::ModeOf(RECORD), 0600U);
}

TEST_F(AttemptLogTest, ALongRecordBeginsAnew) {
  testsupport::WriteFile(RECORD, std::string(1024 * 1024, 'x'));
  AttemptLog::Rotate();
  log_.Note("undo", "new");
  EXPECT_EQ(Lines().size(), 1U);
  EXPECT_TRUE(testsupport::Exists(RECORD + ".1"));
}

TEST_F(AttemptLogTest, AShortRecordGoesOn) {
  log_.Note("undo", "old");
  AttemptLog::Rotate();
  log_.Note("undo", "new");
  EXPECT_EQ(Lines().size(), 2U);
}

TEST(AttemptLogWithoutFolderTest, ARecordThatCannotBeWrittenStopsNothing) {
  const AttemptLog log(1, "join");
  EXPECT_NO_THROW(log.Note("undo", "x"));
}

}  // namespace
}  // namespace sambaprovider
