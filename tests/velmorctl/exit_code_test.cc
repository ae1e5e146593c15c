#include <gtest/gtest.h>

#include "prepared_host.h"

namespace velmorctltest {

namespace {

/// Leaves are not repeated by the library, so a leave shows any status at once.
class StatusExitCodeTest : public PreparedHost,
                           public ::testing::WithParamInterface<std::pair<unsigned, int>> {};

TEST_P(StatusExitCodeTest, FollowsFromTheProvidersStatus) {
  MakeJoined();
  const auto& [status, exitCode] = GetParam();
  Script("status.partDomain", std::to_string(status));
  const Outcome outcome = Velmorctl({"leave", "-U", "alice", "--password-file", PASSWORD_FILE});
  EXPECT_EQ(outcome.exitCode, exitCode) << outcome.errors;
  EXPECT_NE(outcome.errors.find("\n  changed:  nothing\n  try:      "), std::string::npos) << outcome.errors;
}

INSTANTIATE_TEST_SUITE_P(
    Each, StatusExitCodeTest,
    ::testing::Values(std::pair{2U, 1}, std::pair{5U, 6}, std::pair{8U, 1}, std::pair{86U, 6},
                      std::pair{87U, 1}, std::pair{120U, 9}, std::pair{267U, 1}, std::pair{609U, 9},
                      std::pair{1060U, 7}, std::pair{1061U, 10}, std::pair{1062U, 7}, std::pair{1064U, 7},
                      std::pair{1067U, 7}, std::pair{1201U, 8}, std::pair{1210U, 7}, std::pair{1212U, 8},
                      std::pair{1222U, 8}, std::pair{1225U, 8}, std::pair{1229U, 8}, std::pair{1311U, 8},
                      std::pair{1315U, 6}, std::pair{1317U, 6}, std::pair{1326U, 6}, std::pair{1330U, 6},
                      std::pair{1331U, 6}, std::pair{1355U, 8}, std::pair{1359U, 1}, std::pair{1398U, 7},
                      std::pair{1786U, 4}, std::pair{1787U, 4}, std::pair{1793U, 6}, std::pair{1810U, 4},
                      std::pair{1907U, 6}, std::pair{1909U, 6}, std::pair{2138U, 7}, std::pair{2224U, 10},
                      std::pair{2691U, 10}, std::pair{10060U, 8}, std::pair{0x80090325U, 12},
                      std::pair{4711U, 1}),
    [](const auto& test) { return "Status" + std::to_string(test.param.first); });

class ExitCodeTest : public PreparedHost {};

TEST_F(ExitCodeTest, IsTwoWithoutACommand) {
  EXPECT_EQ(Velmorctl({}).exitCode, 2);
}

TEST_F(ExitCodeTest, IsTwoForAnUnknownCommand) {
  EXPECT_EQ(Velmorctl({"frobnicate"}).exitCode, 2);
}

TEST_F(ExitCodeTest, IsTwoForAnUnknownOption) {
  EXPECT_EQ(Velmorctl({"status", "--frobnicate"}).exitCode, 2);
}

TEST_F(ExitCodeTest, IsTwoForATimeoutThatIsNoNumberOfSeconds) {
  EXPECT_EQ(Velmorctl({"status", "--timeout", "0"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"status", "--timeout", "soon"}).exitCode, 2);
}

TEST_F(ExitCodeTest, IsZeroForHelpAndVersion) {
  EXPECT_EQ(Velmorctl({"--help"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"join", "--help"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"--version"}).exitCode, 0);
}

TEST_F(ExitCodeTest, IsOneWhenTheOutputCannotBeWritten) {
  EXPECT_EQ(Velmorctl({"store", "list"}, WithOutputTo("/dev/full")).exitCode, 1);
}

class ChangingCommandTest : public PreparedHost,
                            public ::testing::WithParamInterface<std::vector<std::string>> {};

TEST_P(ChangingCommandTest, NeedsRoot) {
  const Outcome outcome = Velmorctl(GetParam(), WithoutRoot());
  EXPECT_EQ(outcome.exitCode, 77);
  EXPECT_NE(outcome.errors.find("velmorctl: only root may "), std::string::npos) << outcome.errors;
  EXPECT_TRUE(Calls().empty());
}

INSTANTIATE_TEST_SUITE_P(Each, ChangingCommandTest,
                         ::testing::Values(std::vector<std::string>{"join", "corp.example"},
                                           std::vector<std::string>{"leave"},
                                           std::vector<std::string>{"store", "use", "None"},
                                           std::vector<std::string>{"provider", "use", "ctlscript"},
                                           std::vector<std::string>{"dc", "prefer", "dc1"},
                                           std::vector<std::string>{"smartcard", "set", "login"},
                                           std::vector<std::string>{"option", "set", "A.b", "1"},
                                           std::vector<std::string>{"nss", "add", "passwd", "winbind"}),
                         [](const auto& test) { return test.param[0]; });

class ReadingCommandTest : public PreparedHost,
                           public ::testing::WithParamInterface<std::vector<std::string>> {};

TEST_P(ReadingCommandTest, WorksWithoutRoot) {
  MakeJoined();
  const Outcome outcome = Velmorctl(GetParam(), WithoutRoot());
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
}

INSTANTIATE_TEST_SUITE_P(
    Each, ReadingCommandTest,
    ::testing::Values(std::vector<std::string>{"status"}, std::vector<std::string>{"trust", "show"},
                      std::vector<std::string>{"store", "list"}, std::vector<std::string>{"provider", "show"},
                      std::vector<std::string>{"dc", "show"}, std::vector<std::string>{"smartcard", "list"},
                      std::vector<std::string>{"option", "get"}, std::vector<std::string>{"nss", "show"}),
    [](const auto& test) { return test.param[0]; });

TEST_F(ExitCodeTest, IsSeventySevenWhenOnlyRootMayReadAFile) {
  testsupport::SetMode(testsupport::AUTHENTICATION_CONF, 0);
  EXPECT_EQ(Velmorctl({"store", "show"}, WithoutRoot()).exitCode, 77);
}

}  // namespace

}  // namespace velmorctltest
