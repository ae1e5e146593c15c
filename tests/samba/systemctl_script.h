#ifndef SAMBA_SYSTEMCTL_SCRIPT_H
#define SAMBA_SYSTEMCTL_SCRIPT_H

#include <gtest/gtest.h>
#include <sys/mount.h>

#include <string>

#include "support/files.h"

/// Makes the sandbox a host where systemd runs, with a script in systemctl's place, which notes its arguments
/// and then does `work`.
inline void ReplaceSystemctl(const std::string& work) {
  const std::string script = "/run/script";
  testsupport::MakeFolders("/run/systemd/system");
  testsupport::WriteFile(script, "#!/bin/sh\necho \"$@\" >> /run/calls\n" + work + "\n");
  testsupport::SetMode(script, 0755);
  ASSERT_EQ(mount(script.c_str(), "/usr/bin/systemctl", nullptr, MS_BIND, nullptr), 0);
}

/// The arguments so far, one call a line.
inline std::string SystemctlCalls() {
  return testsupport::ReadFile("/run/calls");
}

#endif  // SAMBA_SYSTEMCTL_SCRIPT_H
