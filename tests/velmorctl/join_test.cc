#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>

#include "prepared_host.h"
#include "support/machine.h"

namespace velmorctltest {

namespace {

using testsupport::ReadFile;
using testsupport::WriteFile;

class JoinTest : public PreparedHost {
 protected:
  static const inline std::string JOIN_CALL = "joinDomain corp.example - alice (15 characters)";

  /// Starts a join that waits in the provider's operation.
  static std::vector<std::string> HangingJoin() {
    Script("hang.joinDomain", "");
    return Join();
  }

  static bool Recorded() {
    return Velmorctl({"status", "--json"}).Json()["recordedDomain"] == "corp.example";
  }
};

TEST_F(JoinTest, JoinsRecordsAndActivates) {
  const Outcome outcome = Velmorctl(Join());
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.output,
            "The host is joined to corp.example, and the store \"Active Directory\" is active.\n");
  EXPECT_TRUE(Called(JOIN_CALL));
  EXPECT_TRUE(Recorded());
  EXPECT_EQ(ActiveStore(), "Active Directory");
}

TEST_F(JoinTest, PassesTheOrganizationalUnitBehindTheFirstSlash) {
  EXPECT_EQ(Velmorctl(Join("corp.example/Servers/Hosts")).exitCode, 0);
  EXPECT_TRUE(Called("joinDomain corp.example Servers/Hosts alice (15 characters)"));
}

TEST_F(JoinTest, JoinsAsAdministratorUnlessToldOtherwise) {
  EXPECT_EQ(
      Velmorctl({"join", "corp.example", "--password-file", PASSWORD_FILE, "--skip-hostname-check"}).exitCode,
      0);
  EXPECT_TRUE(Called("joinDomain corp.example - Administrator (15 characters)"));
}

TEST_F(JoinTest, WritesStepsTimesAndTheProvidersRecordToStandardError) {
  const std::string errors = Velmorctl(Join()).errors;
  EXPECT_NE(errors.find(" s] joining corp.example as alice\n"), std::string::npos) << errors;
  EXPECT_NE(errors.find(" s] ctlscript: password: asking a controller\n"), std::string::npos) << errors;
  EXPECT_NE(errors.find(" s] joined corp.example and recorded it\n"), std::string::npos) << errors;
  EXPECT_NE(errors.find(" s] trust state: healthy\n"), std::string::npos) << errors;
}

TEST_F(JoinTest, ShowsTheRecordWhileTheProviderStillWorks) {
  RunningProgram join(HangingJoin());
  EXPECT_TRUE(Eventually([&join] {
    return join.ErrorsSoFar().find("ctlscript: password: asking a controller") != std::string::npos;
  }));
}

TEST_F(JoinTest, PassesOverOtherProcessesInTheRecord) {
  testsupport::MakeFolders("/var/lib/quenix/ctlscript");
  WriteFile("/var/lib/quenix/ctlscript/attempts.log", "");
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  WriteFile("/var/lib/quenix/ctlscript/attempts.log",
            ReadFile("/var/lib/quenix/ctlscript/attempts.log") +
                R"({"process":1,"step":"other","event":"begin","status":0,"text":"not ours"})" + "\n");
  RemoveScript("hang.joinDomain");
  EXPECT_EQ(join.Wait().errors.find("not ours"), std::string::npos);
}

TEST_F(JoinTest, GivesTheProvidersReasonForAFailure) {
  Script("status.joinDomain", "86");
  const Outcome outcome = Velmorctl(Join());
  EXPECT_EQ(outcome.exitCode, 6);
  EXPECT_NE(outcome.errors.find("velmorctl: cannot join corp.example as alice: Exception 0x00000056: "
                                "The specified network password is not correct.\n"
                                "  status:   86\n"
                                "  provider: the controller refused\n"
                                "  changed:  nothing\n"
                                "  try:      check the user name and the password"),
            std::string::npos)
      << outcome.errors;
}

TEST_F(JoinTest, LeavesTheStoreAloneWhenTheProviderRefuses) {
  Script("status.joinDomain", "86");
  Velmorctl(Join());
  EXPECT_EQ(ActiveStore(), "None");
  EXPECT_FALSE(Recorded());
}

TEST_F(JoinTest, RefusesAHostThatIsJoinedBeforeItAsksForThePassword) {
  MakeJoined();
  const Outcome outcome = Velmorctl({"join", "other.example", "--password-file", "/run/no-such-file"});
  EXPECT_EQ(outcome.exitCode, 10);
  EXPECT_NE(outcome.errors.find("the host is joined to corp.example already"), std::string::npos)
      << outcome.errors;
}

TEST_F(JoinTest, RefusesAnEmptyDomain) {
  EXPECT_EQ(Velmorctl(Join("/Servers")).exitCode, 2);
  EXPECT_TRUE(Calls().empty());
}

TEST_F(JoinTest, RefusesToBeginWhenTheStoreCouldNotBeActivatedAfterwards) {
  testsupport::RemoveFile(testsupport::AUTHENTICATION_CONF);
  const Outcome outcome = Velmorctl(Join());
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_FALSE(Called(JOIN_CALL));
  EXPECT_NE(outcome.errors.find("authentication.conf"), std::string::npos) << outcome.errors;
}

TEST_F(JoinTest, RefusesASecondJoinAtTheSameTime) {
  RunningProgram first(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  const Outcome second = Velmorctl(Join());
  EXPECT_EQ(second.exitCode, 10);
  EXPECT_NE(
      second.errors.find("another velmorctl (process " + std::to_string(first.Process()) + ") is joining"),
      std::string::npos)
      << second.errors;
  RemoveScript("hang.joinDomain");
  EXPECT_EQ(first.Wait().exitCode, 0);
}

TEST_F(JoinTest, LetsOnlyRootHoldItsLock) {
  ASSERT_EQ(Velmorctl(Join()).exitCode, 0);
  EXPECT_EQ(testsupport::ModeOf("/run/velmor/velmorctl.lock"), 0600U);
}

TEST_F(JoinTest, RefusesALeaveAtTheSameTime) {
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  EXPECT_EQ(Velmorctl({"leave"}).exitCode, 10);
}

TEST_F(JoinTest, UndoesTheJoinWhenItIsInterrupted) {
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGINT);
  ASSERT_TRUE(Eventually([&join] { return join.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  RemoveScript("hang.joinDomain");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGINT);
  EXPECT_TRUE(Called("partDomain alice"));
  EXPECT_FALSE(JoinedAtProvider());
  EXPECT_FALSE(Recorded());
  EXPECT_EQ(ActiveStore(), "None");
  EXPECT_NE(
      outcome.errors.find("the host has left the domain again\n"
                          "  changed:  the computer account, which may stay in the directory, disabled\n"),
      std::string::npos)
      << outcome.errors;
}

TEST_F(JoinTest, SaysWhyItHadFailedWhenItIsInterrupted) {
  Script("status.joinDomain", "86");
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGINT);
  ASSERT_TRUE(Eventually([&join] { return join.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  RemoveScript("hang.joinDomain");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGINT);
  EXPECT_NE(outcome.errors.find("interrupted; the join had failed by then: Exception 0x00000056: "),
            std::string::npos)
      << outcome.errors;
}

TEST_F(JoinTest, SaysThatTheAccountStaysWhenTheJoinCannotBeRecorded) {
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  testsupport::WriteFile("/var/lib/quenix/configstore.db", std::string(4096, 'x'));
  RemoveScript("hang.joinDomain");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_TRUE(Called("partDomain -"));
  EXPECT_NE(outcome.errors.find("changed:  the computer account, which stays in the directory\n"),
            std::string::npos)
      << outcome.errors;
}

TEST_F(JoinTest, GoesOnWhenNobodyReadsItsProgress) {
  const std::string progress = "/run/progress";
  ASSERT_EQ(mkfifo(progress.c_str(), 0600), 0);
  const int reader = open(progress.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
  RunningProgram join(HangingJoin(), WithErrorsTo(progress));
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  close(reader);
  RemoveScript("hang.joinDomain");
  EXPECT_EQ(join.Wait().exitCode, 0);
  EXPECT_TRUE(Recorded());
}

TEST_F(JoinTest, SaysThatTheHostStaysJoinedWhenTheJoinCannotBeUndone) {
  Script("status.partDomain", "1225");
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGTERM);
  ASSERT_TRUE(Eventually([&join] { return join.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  RemoveScript("hang.joinDomain");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGTERM);
  EXPECT_NE(outcome.errors.find("changed:  the host has joined corp.example"), std::string::npos)
      << outcome.errors;
  EXPECT_TRUE(Recorded());
}

TEST_F(JoinTest, EndsAtOnceWhenItIsInterruptedTwice) {
  RunningProgram join(HangingJoin());
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGINT);
  ASSERT_TRUE(Eventually([&join] { return join.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  join.Signal(SIGINT);
  EXPECT_EQ(join.Wait().signalNumber, SIGINT);
}

TEST_F(JoinTest, StaysJoinedWhenOnlyTheVerificationIsInterrupted) {
  Script("hang.getDomainTrustState", "");
  RunningProgram join(Join());
  ASSERT_TRUE(Eventually([] { return Called("getDomainTrustState"); }));
  join.Signal(SIGINT);
  EXPECT_EQ(join.Wait().signalNumber, SIGINT);
  EXPECT_TRUE(JoinedAtProvider());
  EXPECT_EQ(ActiveStore(), "Active Directory");
}

TEST_F(JoinTest, ReportsATrustThatIsBrokenAfterTheJoin) {
  Script("trustState", "10");
  const Outcome outcome = Velmorctl(Join());
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_NE(outcome.errors.find("could not be verified: broken"), std::string::npos) << outcome.errors;
  EXPECT_EQ(ActiveStore(), "Active Directory");
}

TEST_F(JoinTest, WaitsForAControllerThatDoesNotKnowTheNewAccountYet) {
  Script("trustState", "3");
  RunningProgram join(Join());
  EXPECT_TRUE(Eventually([&join] {
    return join.ErrorsSoFar().find("waiting until the controller in use knows the account") !=
           std::string::npos;
  }));
  RemoveScript("trustState");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_NE(outcome.errors.find(" s] trust state: healthy\n"), std::string::npos) << outcome.errors;
}

TEST_F(JoinTest, ChecksTheHostNameAndSaysWhatIsWrong) {
  const Outcome outcome = Velmorctl({"join", "corp.example", "--password-file", PASSWORD_FILE});
  EXPECT_EQ(outcome.exitCode, 7);
  EXPECT_NE(outcome.errors.find("The current hostname is invalid: "), std::string::npos) << outcome.errors;
  EXPECT_FALSE(Called("joinDomain corp.example - Administrator (15 characters)"));
}

TEST_F(JoinTest, SaysThatTheHostNameCheckChangedTheHostsFile) {
  testsupport::AddInterface("net0", "10.9.8.7");
  WriteFile("/etc/hosts", "127.0.0.1 localhost\n127.0.1.1 sandbox.corp.example sandbox\n");
  Script("status.joinDomain", "86");
  const Outcome outcome = Velmorctl({"join", "corp.example", "--password-file", PASSWORD_FILE});
  EXPECT_EQ(outcome.exitCode, 6);
  EXPECT_NE(outcome.errors.find("changed:  /etc/hosts\n"), std::string::npos) << outcome.errors;
  EXPECT_NE(ReadFile("/etc/hosts").find("10.9.8.7"), std::string::npos);
}

}  // namespace

}  // namespace velmorctltest
