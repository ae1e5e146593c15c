// The state file.

#include "common/state.h"

#include <gtest/gtest.h>

#include "common/files.h"
#include "expect_failure.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

const char* const STATE_FILE = "/var/lib/quenix/samba/state.json";

State Joined() {
  State state;
  state.joined = true;
  state.dnsDomain = "corp.example";
  state.netbiosDomain = "CORP";
  state.hostName = "HOST1";
  state.machineAccountDn = "CN=HOST1,OU=M\xc3\xbcnchen,DC=corp,DC=example";
  state.preferredDomainControllers = {"dc1.corp.example", "dc2.corp.example"};
  state.smartCardEnabledServices = {"sshd"};
  return state;
}

TEST(StateTest, AHostWithoutAFileHasJoinedNothing) {
  const State state = LoadState();
  EXPECT_FALSE(state.joined);
  EXPECT_EQ(state.dnsDomain, "");
}

TEST(StateTest, WhatIsSavedIsLoaded) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  SaveState(Joined());
  const State state = LoadState();
  EXPECT_TRUE(state.joined);
  EXPECT_EQ(state.dnsDomain, "corp.example");
  EXPECT_EQ(state.netbiosDomain, "CORP");
  EXPECT_EQ(state.hostName, "HOST1");
  EXPECT_EQ(state.machineAccountDn, Joined().machineAccountDn);
  EXPECT_EQ(state.preferredDomainControllers, Joined().preferredDomainControllers);
  EXPECT_EQ(state.smartCardEnabledServices, Joined().smartCardEnabledServices);
}

TEST(StateTest, TheFileIsReadableByAll) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  SaveState(Joined());
  EXPECT_EQ(testsupport::ModeOf(STATE_FILE), 0644U);
}

TEST(StateTest, SavingLeavesNothingElseBehind) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  SaveState(Joined());
  SaveState(State{});
  EXPECT_EQ(testsupport::NamesIn("/var/lib/quenix/samba"), std::vector<std::string>{"state.json"});
}

TEST(StateTest, ADamagedFileIsAnErrorAndNotAnUnjoinedHost) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  const std::string whole = FormatState(Joined());
  testsupport::WriteFile(STATE_FILE, whole.substr(0, whole.size() / 2));
  EXPECT_FAILURE(LoadState(), 1359);
}

TEST(StateTest, AFieldOfAnotherTypeIsAnError) {
  EXPECT_FAILURE(ParseState("{\"format\":1,\"joined\":1}"), 1359);
}

TEST(StateTest, AnotherFormatIsAnError) {
  EXPECT_FAILURE(ParseState("{\"format\":2}"), 1359);
}

TEST(StateTest, ATextThatIsNotUtf8IsRefused) {
  State state = Joined();
  state.smartCardEnabledServices = {"\xff"};
  EXPECT_FAILURE(FormatState(state), 87);
}

TEST(StateTest, AFailedWriteKeepsTheOldFile) {
  testsupport::MakeFolders("/var/lib/quenix/samba");
  const testsupport::SmallFileSystem disk("/var/lib/quenix/samba", 8192);
  SaveState(Joined());
  State large = Joined();
  large.smartCardEnabledServices.assign(1000, "a service with quite a long name");
  EXPECT_FAILURE(SaveState(large), 1359);
  EXPECT_EQ(LoadState().smartCardEnabledServices, Joined().smartCardEnabledServices);
  EXPECT_EQ(testsupport::NamesIn("/var/lib/quenix/samba"), std::vector<std::string>{"state.json"});
}

}  // namespace
}  // namespace sambaprovider
