#include <gtest/gtest.h>

#include <csignal>

#include "prepared_host.h"

namespace velmorctltest {

namespace {

const std::vector<std::string> LEAVE_AS_ALICE = {"leave", "-U", "alice", "--password-file", PASSWORD_FILE};

class LeaveTest : public PreparedHost {
 protected:
  LeaveTest() { MakeJoined(); }

  static nlohmann::json RecordedDomain() { return Velmorctl({"status", "--json"}).Json()["recordedDomain"]; }
};

TEST_F(LeaveTest, LeavesWithoutAnAccountAndRemovesTheRecord) {
  const Outcome outcome = Velmorctl({"leave"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_TRUE(Called("partDomain -"));
  EXPECT_TRUE(RecordedDomain().is_null());
}

TEST_F(LeaveTest, RemovesTheRecordAlsoWhenItLeavesWithAnAccount) {
  const Outcome outcome = Velmorctl(LEAVE_AS_ALICE);
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_TRUE(Called("partDomain alice"));
  EXPECT_TRUE(RecordedDomain().is_null());
}

TEST_F(LeaveTest, KeepsTheRecordWhenTheProviderRefuses) {
  Script("status.partDomain", "86");
  EXPECT_EQ(Velmorctl(LEAVE_AS_ALICE).exitCode, 6);
  EXPECT_EQ(RecordedDomain(), "corp.example");
}

TEST_F(LeaveTest, SaysThatTheStoreIsStillActive) {
  EXPECT_NE(Velmorctl({"leave"}).output.find("velmorctl store use None"), std::string::npos);
  EXPECT_EQ(ActiveStore(), "Active Directory");
}

TEST_F(LeaveTest, RemovesARecordThatTheProviderDoesNotKnowOf) {
  RemoveScript("domain");
  Script("status.partDomain", "2692");
  EXPECT_EQ(Velmorctl({"leave"}).exitCode, 0);
  EXPECT_TRUE(RecordedDomain().is_null());
}

TEST_F(LeaveTest, RefusesAHostThatHasJoinedNothing) {
  ASSERT_EQ(Velmorctl({"leave"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"leave"}).exitCode, 3);
}

TEST_F(LeaveTest, FinishesWhatItHasBegunWhenItIsInterrupted) {
  Script("hang.partDomain", "");
  RunningProgram leave(LEAVE_AS_ALICE);
  ASSERT_TRUE(Eventually([] { return Called("partDomain alice"); }));
  leave.Signal(SIGINT);
  ASSERT_TRUE(
      Eventually([&leave] { return leave.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  RemoveScript("hang.partDomain");
  EXPECT_EQ(leave.Wait().signalNumber, SIGINT);
  EXPECT_TRUE(RecordedDomain().is_null());
}

void DamageRecords() {
  testsupport::WriteFile("/var/lib/quenix/configstore.db", std::string(4096, 'x'));
}

TEST_F(LeaveTest, DoesNotBeginWhenTheRecordCannotBeRead) {
  DamageRecords();
  const Outcome outcome = Velmorctl({"leave"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("/var/lib/quenix/configstore.db"), std::string::npos) << outcome.errors;
  EXPECT_TRUE(JoinedAtProvider());
}

TEST_F(LeaveTest, SaysThatTheHostHasLeftWhenTheRecordCannotBeRemoved) {
  Script("hang.partDomain", "");
  RunningProgram leave(LEAVE_AS_ALICE);
  ASSERT_TRUE(Eventually([] { return Called("partDomain alice"); }));
  DamageRecords();
  RemoveScript("hang.partDomain");
  const Outcome outcome = leave.Wait();
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("changed:  the host has left corp.example"), std::string::npos)
      << outcome.errors;
}

TEST_F(LeaveTest, SaysSoAlsoWhenItIsInterrupted) {
  Script("hang.partDomain", "");
  RunningProgram leave(LEAVE_AS_ALICE);
  ASSERT_TRUE(Eventually([] { return Called("partDomain alice"); }));
  leave.Signal(SIGINT);
  ASSERT_TRUE(
      Eventually([&leave] { return leave.ErrorsSoFar().find("interrupted: ") != std::string::npos; }));
  DamageRecords();
  RemoveScript("hang.partDomain");
  const Outcome outcome = leave.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGINT);
  EXPECT_NE(outcome.errors.find("the host has left the domain, but the record of the join is still there"),
            std::string::npos)
      << outcome.errors;
}

}  // namespace

}  // namespace velmorctltest
