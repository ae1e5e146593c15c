#include <gtest/gtest.h>
#include <sys/resource.h>

#include <csignal>
#include <fstream>
#include <iterator>

#include "prepared_host.h"
#include "process_memory.h"
#include "terminal_session.h"

namespace velmorctltest {

namespace {

const std::vector<std::string> JOIN_AT_TERMINAL = {"join", "corp.example", "-U", "alice",
                                                   "--skip-hostname-check"};

std::vector<std::string> JoinWith(std::vector<std::string> source) {
  std::vector<std::string> arguments = JOIN_AT_TERMINAL;
  arguments.insert(arguments.end(), source.begin(), source.end());
  return arguments;
}

std::string Raw(const std::string& path) {
  std::ifstream stream(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(stream), {});
}

class PasswordTest : public PreparedHost {
 protected:
  static const inline std::string JOIN_CALL = "joinDomain corp.example - alice (15 characters)";
};

TEST_F(PasswordTest, IsTheFirstLineOfAFile) {
  testsupport::WriteFile(PASSWORD_FILE, PASSWORD + "\nanother line\n");
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, NeedsNoNewlineAtTheEndOfTheFile) {
  testsupport::WriteFile(PASSWORD_FILE, PASSWORD);
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, LosesACarriageReturn) {
  testsupport::WriteFile(PASSWORD_FILE, PASSWORD + "\r\n");
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, IsReadFromStandardInputForADash) {
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", "-"}), WithInput(PASSWORD + "\n")).exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, IsReadFromADescriptor) {
  EXPECT_EQ(Velmorctl(JoinWith({"--password-fd", "10"}), WithDescriptor(PASSWORD + "\n")).exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, CannotComeFromTwoPlaces) {
  EXPECT_EQ(Velmorctl(JoinWith({"--password-fd", "0", "--password-file", PASSWORD_FILE})).exitCode, 2);
}

TEST_F(PasswordTest, BelongsToAUserInALeave) {
  MakeJoined();
  EXPECT_EQ(Velmorctl({"leave", "--password-file", PASSWORD_FILE}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"leave", "--password-fd", "10"}, WithDescriptor(PASSWORD + "\n")).exitCode, 2);
  EXPECT_TRUE(JoinedAtProvider());
}

TEST_F(PasswordTest, HasNoUseInAJoinThroughTheProxy) {
  for (const std::string& option :
       {std::string("--user=alice"), "--password-file=" + PASSWORD_FILE, std::string("--password-fd=0")}) {
    const Outcome outcome = Velmorctl({"join", "--proxy", "10.9.8.7", option});
    EXPECT_EQ(outcome.exitCode, 2) << option;
    EXPECT_NE(outcome.errors.find("excludes"), std::string::npos) << outcome.errors;
  }
}

TEST_F(PasswordTest, CannotBeGivenAsAnOption) {
  EXPECT_EQ(Velmorctl(JoinWith({"--password", PASSWORD})).exitCode, 2);
  EXPECT_EQ(Velmorctl(JoinWith({PASSWORD})).exitCode, 2);
}

TEST_F(PasswordTest, IsNotTakenFromAFileThatEverybodyCanRead) {
  testsupport::SetMode(PASSWORD_FILE, 0644);
  const Outcome outcome = Velmorctl(JoinWith({"--password-file", PASSWORD_FILE}));
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_NE(outcome.errors.find("chmod 600"), std::string::npos) << outcome.errors;
}

TEST_F(PasswordTest, IsMissingWhenTheFileIs) {
  const Outcome outcome = Velmorctl(JoinWith({"--password-file", "/run/no-such-file"}));
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_NE(outcome.errors.find("'/run/no-such-file': No such file or directory"), std::string::npos)
      << outcome.errors;
}

TEST_F(PasswordTest, IsMissingWhenTheDescriptorIsNotOpen) {
  EXPECT_EQ(Velmorctl(JoinWith({"--password-fd", "77"})).exitCode, 2);
}

TEST_F(PasswordTest, MustNotBeEmpty) {
  testsupport::WriteFile(PASSWORD_FILE, "\n");
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 6);
}

TEST_F(PasswordTest, MustNotHoldANullCharacter) {
  testsupport::WriteFile(PASSWORD_FILE, std::string("half\0other", 10));
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 2);
}

TEST_F(PasswordTest, MustNotBeTooLong) {
  testsupport::WriteFile(PASSWORD_FILE, std::string(4001, 'a'));
  EXPECT_EQ(Velmorctl(JoinWith({"--password-file", PASSWORD_FILE})).exitCode, 2);
}

TEST_F(PasswordTest, NeedsATerminalWhenNoSourceIsGiven) {
  const Outcome outcome = Velmorctl(JOIN_AT_TERMINAL);
  EXPECT_EQ(outcome.exitCode, 2);
  EXPECT_NE(outcome.errors.find("there is no terminal"), std::string::npos) << outcome.errors;
}

TEST_F(PasswordTest, IsAskedForWithoutEcho) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  EXPECT_FALSE(session.Echoes());
  session.Type(PASSWORD + "\n");
  const Outcome outcome = session.Wait();
  EXPECT_EQ(outcome.exitCode, 0) << outcome.output;
  EXPECT_TRUE(Called(JOIN_CALL));
  EXPECT_EQ(outcome.output.find(PASSWORD), std::string::npos);
  EXPECT_TRUE(session.Echoes());
}

TEST_F(PasswordTest, PromptRestoresTheTerminalOnControlC) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  session.Type("half\x03");
  const Outcome outcome = session.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGINT);
  EXPECT_TRUE(session.Echoes());
  EXPECT_FALSE(Called(JOIN_CALL));
}

class PromptSignalTest : public PasswordTest, public ::testing::WithParamInterface<int> {};

TEST_P(PromptSignalTest, RestoresTheTerminalAndEndsByTheSignal) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  session.Signal(GetParam());
  EXPECT_EQ(session.Wait().signalNumber, GetParam());
  EXPECT_TRUE(session.Echoes());
}

INSTANTIATE_TEST_SUITE_P(Each, PromptSignalTest, ::testing::Values(SIGINT, SIGTERM, SIGHUP, SIGQUIT),
                         [](const auto& test) { return std::string(sigabbrev_np(test.param)); });

TEST_F(PasswordTest, PromptRestoresTheTerminalWhileItIsStoppedAndAsksAgain) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  session.Type("half\x1a");
  ASSERT_TRUE(session.AwaitStop());
  EXPECT_TRUE(session.Echoes());
  session.Signal(SIGCONT);
  ASSERT_TRUE(session.AwaitText("Password of alice: \r\nPassword of alice: "));
  EXPECT_FALSE(session.Echoes());
  session.Type(PASSWORD + "\n");
  EXPECT_EQ(session.Wait().exitCode, 0);
  EXPECT_TRUE(Called(JOIN_CALL));
}

TEST_F(PasswordTest, PromptRestoresTheTerminalAtTheEndOfInput) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  session.Type("\x04");
  EXPECT_EQ(session.Wait().exitCode, 2);
  EXPECT_TRUE(session.Echoes());
}

TEST_F(PasswordTest, PromptRestoresTheTerminalWhenThePasswordIsTooLong) {
  TerminalSession session(JOIN_AT_TERMINAL);
  ASSERT_TRUE(session.AwaitText("Password of alice: "));
  // A terminal takes 4095 characters to a line.
  session.Type(std::string(4050, 'a') + "\n");
  EXPECT_EQ(session.Wait().exitCode, 2);
  EXPECT_TRUE(session.Echoes());
}

TEST_F(PasswordTest, StandsNeitherInTheCommandLineNorInTheEnvironment) {
  Script("hang.joinDomain", "");
  RunningProgram join(JoinWith({"--password-fd", "10"}), WithDescriptor(PASSWORD));
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  const std::string process = "/proc/" + std::to_string(join.Process());
  EXPECT_NE(Raw(process + "/cmdline").find("corp.example"), std::string::npos);
  EXPECT_EQ(Raw(process + "/cmdline").find(PASSWORD), std::string::npos);
  EXPECT_FALSE(Raw(process + "/environ").empty());
  EXPECT_EQ(Raw(process + "/environ").find(PASSWORD), std::string::npos);
}

TEST_F(PasswordTest, IsWipedFromMemoryAfterTheJoin) {
  Script("hang.joinDomain", "");
  Script("hang.getDomainTrustState", "");
  RunningProgram join(JoinWith({"--password-file", PASSWORD_FILE}));
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  ASSERT_TRUE(MemoryHolds(join.Process(), PASSWORD));
  RemoveScript("hang.joinDomain");
  ASSERT_TRUE(Eventually([] { return Called("getDomainTrustState"); }));
  EXPECT_FALSE(MemoryHolds(join.Process(), PASSWORD));
}

TEST_F(PasswordTest, IsInNoCoreFile) {
  rlimit size = {};
  ASSERT_EQ(getrlimit(RLIMIT_CORE, &size), 0);
  ASSERT_NE(size.rlim_max, 0U) << "no process may leave a core file here";
  size.rlim_cur = size.rlim_max;
  ASSERT_EQ(setrlimit(RLIMIT_CORE, &size), 0);
  Script("hang.joinDomain", "");
  RunningProgram join(JoinWith({"--password-file", PASSWORD_FILE}));
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGQUIT);
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGQUIT);
  EXPECT_FALSE(outcome.leftCoreFile);
}

TEST_F(PasswordTest, StandsInNoMessage) {
  Script("status.joinDomain", "86");
  const Outcome outcome = Velmorctl(JoinWith({"--password-file", PASSWORD_FILE}));
  EXPECT_EQ((outcome.output + outcome.errors).find(PASSWORD), std::string::npos);
}

}  // namespace

}  // namespace velmorctltest
