// How winbindd is started and stopped on a host where systemd runs, with a script in systemctl's place.

#include "helper/winbind_service.h"

#include <gtest/gtest.h>
#include <sys/mount.h>

#include "expect_failure.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

const std::string CALLS = "/run/calls";

class WinbindThroughSystemdTest : public testing::Test {
 protected:
  WinbindThroughSystemdTest() { testsupport::MakeFolders("/run/systemd/system"); }

  /// The script notes its arguments and then does `work`.
  static void ReplaceSystemctl(const std::string& work) {
    const std::string script = "/run/script";
    testsupport::WriteFile(script, "#!/bin/sh\necho \"$@\" >> " + CALLS + "\n" + work + "\n");
    testsupport::SetMode(script, 0755);
    ASSERT_EQ(mount(script.c_str(), "/usr/bin/systemctl", nullptr, MS_BIND, nullptr), 0);
  }

  static std::string Calls() { return testsupport::ReadFile(CALLS); }
};

TEST_F(WinbindThroughSystemdTest, ItIsStoppedThroughItsUnit) {
  ReplaceSystemctl("exit 0");
  winbind_service::Stop();
  EXPECT_EQ(Calls(), "--no-ask-password stop winbind.service\n");
}

TEST_F(WinbindThroughSystemdTest, OneThatDoesNotStopIsKilled) {
  ReplaceSystemctl("[ $(wc -l < " + CALLS + ") != 1 ]");
  winbind_service::Stop();
  EXPECT_EQ(Calls(),
            "--no-ask-password stop winbind.service\n"
            "--no-ask-password kill --signal=SIGKILL winbind.service\n"
            "--no-ask-password stop winbind.service\n");
}

TEST_F(WinbindThroughSystemdTest, OneThatStaysIsReported) {
  ReplaceSystemctl("echo 'Unit is masked.'; exit 1");
  EXPECT_FAILURE(winbind_service::Stop(), 1062);
}

TEST_F(WinbindThroughSystemdTest, EarlierStartsDoNotCountAgainstTheNext) {
  ReplaceSystemctl("exit 1");
  EXPECT_FAILURE(winbind_service::Start(), 1062);
  EXPECT_EQ(Calls(),
            "--quiet reset-failed winbind.service\n"
            "--no-ask-password start winbind.service\n");
}

TEST_F(WinbindThroughSystemdTest, ItRunsWhenItsUnitIsActive) {
  ReplaceSystemctl("exit 0");
  EXPECT_TRUE(winbind_service::IsRunning());
  EXPECT_EQ(Calls(), "--quiet is-active winbind.service\n");
}

TEST_F(WinbindThroughSystemdTest, ItDoesNotRunWhenItsUnitIsInactive) {
  ReplaceSystemctl("exit 3");
  EXPECT_FALSE(winbind_service::IsRunning());
}

}  // namespace
}  // namespace sambaprovider
