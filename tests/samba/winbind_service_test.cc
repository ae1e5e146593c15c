// How winbindd is started and stopped on a host where systemd runs, with a script in systemctl's place, and
// what is put into Samba's own cache for it.

#include "helper/winbind_service.h"

#include <gtest/gtest.h>

#include <chrono>

#include "common/child.h"
#include "expect_failure.h"
#include "systemctl_script.h"

namespace sambaprovider {
namespace {

TEST(WinbindThroughSystemdTest, ItIsStoppedThroughItsUnit) {
  ReplaceSystemctl("exit 0");
  winbind_service::Stop();
  EXPECT_EQ(SystemctlCalls(), "--no-ask-password stop winbind.service\n");
}

TEST(WinbindThroughSystemdTest, OneThatDoesNotStopIsKilled) {
  ReplaceSystemctl("[ $(wc -l < /run/calls) != 1 ]");
  winbind_service::Stop();
  EXPECT_EQ(SystemctlCalls(),
            "--no-ask-password stop winbind.service\n"
            "--no-ask-password kill --signal=SIGKILL winbind.service\n"
            "--no-ask-password stop winbind.service\n");
}

TEST(WinbindThroughSystemdTest, OneThatStaysIsReported) {
  ReplaceSystemctl("echo 'Unit is masked.'; exit 1");
  EXPECT_FAILURE(winbind_service::Stop(), 1062);
}

TEST(WinbindThroughSystemdTest, EarlierStartsDoNotCountAgainstTheNext) {
  ReplaceSystemctl("exit 1");
  EXPECT_FAILURE(winbind_service::Start(), 1062);
  EXPECT_EQ(SystemctlCalls(),
            "--quiet reset-failed winbind.service\n"
            "--no-ask-password start winbind.service\n");
}

TEST(WinbindThroughSystemdTest, ItRunsWhenItsUnitIsActive) {
  ReplaceSystemctl("exit 0");
  EXPECT_TRUE(winbind_service::IsRunning());
  EXPECT_EQ(SystemctlCalls(), "--quiet is-active winbind.service\n");
}

TEST(WinbindThroughSystemdTest, ItDoesNotRunWhenItsUnitIsInactive) {
  ReplaceSystemctl("exit 3");
  EXPECT_FALSE(winbind_service::IsRunning());
}

TEST(WinbindCacheTest, TheControllerToBeginWithIsThereUnderEachName) {
  winbind_service::BeginWith("dc3.corp.example", {"CORP", "corp.example"});
  for (const char* key : {"SAFJOIN/DOMAIN/CORP", "SAFJOIN/DOMAIN/CORP.EXAMPLE"}) {
    const ProgramResult found =
        RunProgram({"/usr/bin/net", "cache", "get", key}, ProgramOutput::kWanted, std::chrono::seconds(20));
    EXPECT_NE(found.output.find("Value: dc3.corp.example"), std::string::npos) << found.output;
  }
}

}  // namespace
}  // namespace sambaprovider
