// How winbindd is started and stopped on a host where systemd runs, with a script in systemctl's place.

#include "helper/winbind_service.h"

#include <gtest/gtest.h>

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

}  // namespace
}  // namespace sambaprovider
