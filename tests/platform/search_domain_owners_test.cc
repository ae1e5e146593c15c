// How a search domain is added where a service makes /etc/resolv.conf.
#include <gtest/gtest.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <unistd.h>

#include <csignal>
#include <string>

#include "hostmgmt/host_management_exception.h"
#include "kernctl/dns_config.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/machine.h"

namespace {

using HostMgmt::Lib::HostMgmtException;
using KernCtl::Network::DnsConfigImpl;

const std::string kResolvConf = "/etc/resolv.conf";
const std::string kCalls = "/run/calls";

void Add(const std::string& domain = "corp.example") {
  DnsConfigImpl configuration("defaultTcpipStack");
  configuration.AddUserSearchDomain(domain);
  configuration.SaveConfig();
}

void LinkResolvConfTo(const std::string& target) {
  testsupport::RemoveFile(kResolvConf);
  ASSERT_EQ(symlink(target.c_str(), kResolvConf.c_str()), 0);
}

/// Puts a script in the program's place; it notes its arguments and then does `work`.
void ReplaceProgram(const std::string& program, const std::string& work) {
  const std::string script = "/run/script";
  testsupport::WriteFile(script, "#!/bin/sh\necho \"$@\" >> " + kCalls + "\n" + work + "\n");
  ASSERT_EQ(chmod(script.c_str(), 0755), 0);
  ASSERT_EQ(mount(script.c_str(), program.c_str(), nullptr, MS_BIND, nullptr), 0);
}

std::string Calls() {
  return testsupport::Exists(kCalls) ? testsupport::ReadFile(kCalls) : "";
}

class SystemdResolverTest : public testing::Test {
 protected:
  static constexpr char kMain[] = "/etc/systemd/resolved.conf";
  static constexpr char kDropIns[] = "/etc/systemd/resolved.conf.d/";
  static constexpr char kOwn[] = "/etc/systemd/resolved.conf.d/50-quenix-search-domains.conf";
  static constexpr char kStub[] = "/run/systemd/resolve/stub-resolv.conf";
  static constexpr char kReload[] = "--no-ask-password try-reload-or-restart systemd-resolved.service\n";

  void SetUp() override {
    // The machine's own settings of the service, if it has any, are not those of this host.
    testsupport::MakeFolders("/etc/systemd");
    ASSERT_EQ(mount("empty", "/etc/systemd", "tmpfs", 0, "mode=755"), 0);
    testsupport::MakeFolders("/run/systemd/resolve");
    testsupport::WriteFile(kStub, "nameserver 127.0.0.53\nsearch .\n");
    LinkResolvConfTo("../run/systemd/resolve/stub-resolv.conf");
  }

  /// A host on which systemd runs; the service then makes its file as `work` does.
  static void StartSystemd(const std::string& work) {
    testsupport::MakeFolders("/run/systemd/system");
    ReplaceProgram("/usr/bin/systemctl", work);
  }

  static std::string OwnFile(const std::string& domains) {
    return "# The DNS search domains that this host was given.\n[Resolve]\nDomains=" + domains + "\n";
  }
};

TEST_F(SystemdResolverTest, GetsAFileOfItsOwnConfiguration) {
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
  EXPECT_EQ(testsupport::ModeOf(kOwn), 0644U);
  EXPECT_EQ(testsupport::ReadFile(kStub), "nameserver 127.0.0.53\nsearch .\n");
}

TEST_F(SystemdResolverTest, GetsFurtherDomainsInTheSameFile) {
  Add();
  Add("other.example");
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example other.example"));
}

TEST_F(SystemdResolverTest, KeepsTheAdministratorsFiles) {
  testsupport::MakeFolders(kDropIns);
  testsupport::WriteFile(kMain, "[Resolve]\n#Domains=\nDNS=10.0.0.1\nDomains=a.example\n");
  testsupport::WriteFile(std::string(kDropIns) + "10-site.conf", "[Resolve]\nDomains=b.example\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
  EXPECT_EQ(testsupport::ReadFile(kMain), "[Resolve]\n#Domains=\nDNS=10.0.0.1\nDomains=a.example\n");
}

TEST_F(SystemdResolverTest, ADomainThatTheAdministratorGaveIsNotAdded) {
  testsupport::WriteFile(kMain, "[Resolve]\n Domains = a.example CORP.example.\n");
  Add();
  EXPECT_FALSE(testsupport::Exists(kOwn));
}

TEST_F(SystemdResolverTest, ADomainThatIsForRoutingOnlyIsAdded) {
  testsupport::WriteFile(kMain, "[Resolve]\nDomains=~corp.example\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, AnEmptySettingDropsTheDomainsBeforeIt) {
  testsupport::WriteFile(kMain, "[Resolve]\nDomains=corp.example\nDomains=\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, IsReloadedThroughItsUnit) {
  StartSystemd("echo 'search corp.example' > /run/systemd/resolve/stub-resolv.conf");
  Add();
  EXPECT_EQ(Calls(), kReload);
}

TEST_F(SystemdResolverTest, AddingTwiceReloadsOnce) {
  StartSystemd("echo 'search corp.example' > /run/systemd/resolve/stub-resolv.conf");
  Add();
  Add();
  EXPECT_EQ(Calls(), kReload);
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, ADomainThatALaterFileDropsIsWrittenOnce) {
  testsupport::MakeFolders(kDropIns);
  testsupport::WriteFile(std::string(kDropIns) + "60-site.conf", "[Resolve]\nDomains=\n");
  Add();
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, GetsNoDescriptorOfThisProcess) {
  StartSystemd("[ ! -e /proc/self/fd/77 ] || echo leaked >> " + kCalls);
  ASSERT_EQ(dup2(STDOUT_FILENO, 77), 77);
  Add();
  EXPECT_EQ(Calls(), kReload);
}

TEST_F(SystemdResolverTest, IsNotReloadedWhereSystemdDoesNotRun) {
  ReplaceProgram("/usr/bin/systemctl", "true");
  Add();
  EXPECT_EQ(Calls(), "");
}

TEST_F(SystemdResolverTest, AFailedReloadIsReportedAndTriedAgain) {
  StartSystemd("exit 3");
  const std::string failure = "Unable to run '/usr/bin/systemctl': it ended with status 3";
  EXPECT_THROW_WHAT(Add(), HostMgmtException, failure);
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
  EXPECT_THROW_WHAT(Add(), HostMgmtException, failure);
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, AReloadThatDiesIsReported) {
  StartSystemd("kill -SEGV $$");
  EXPECT_THROW_WHAT(Add(), HostMgmtException,
                    "Unable to run '/usr/bin/systemctl': it was ended by signal 11");
}

TEST_F(SystemdResolverTest, AHostThatIgnoresItsChildrenIsServed) {
  StartSystemd("true");
  signal(SIGCHLD, SIG_IGN);
  EXPECT_NO_THROW(Add());
  EXPECT_EQ(Calls(), kReload);
}

TEST_F(SystemdResolverTest, IsKnownByTheStaticFileToo) {
  LinkResolvConfTo("/usr/lib/systemd/resolv.conf");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
}

TEST_F(SystemdResolverTest, IsKnownBeforeItsFirstStart) {
  testsupport::RemoveFile(kStub);
  Add();
  EXPECT_EQ(testsupport::ReadFile(kOwn), OwnFile("corp.example"));
  EXPECT_FALSE(testsupport::Exists(kStub));
}

class ResolvconfTest : public testing::Test {
 protected:
  static constexpr char kBase[] = "/etc/resolvconf/resolv.conf.d/base";
  static constexpr char kTail[] = "/etc/resolvconf/resolv.conf.d/tail";
  static constexpr char kMade[] = "/run/resolvconf/resolv.conf";

  void SetUp() override {
    testsupport::MakeFolders("/etc/resolvconf/resolv.conf.d");
    testsupport::MakeFolders("/run/resolvconf");
    testsupport::WriteFile(kBase, "");
    testsupport::WriteFile(kTail, "");
    testsupport::WriteFile(kMade, "nameserver 10.0.0.1\nsearch dhcp.example\n");
    LinkResolvConfTo("/etc/resolvconf/run/resolv.conf");
    ASSERT_EQ(symlink("/run/resolvconf", "/etc/resolvconf/run"), 0);
    MountProgram("cat /etc/resolvconf/resolv.conf.d/base > /run/resolvconf/resolv.conf");
  }

  /// The program does not belong to every machine, so the folder that it lies in is covered by an overlay.
  static void MountProgram(const std::string& work) {
    testsupport::MakeFolders("/run/sbin.upper");
    testsupport::MakeFolders("/run/sbin.work");
    const std::string program = "/run/sbin.upper/resolvconf";
    testsupport::WriteFile(program, "#!/bin/sh\necho \"$@\" >> " + kCalls + "\n" + work + "\n");
    ASSERT_EQ(chmod(program.c_str(), 0755), 0);
    ASSERT_EQ(mount("overlay", "/usr/sbin", "overlay", 0,
                    "lowerdir=/usr/sbin,upperdir=/run/sbin.upper,workdir=/run/sbin.work"),
              0);
  }
};

TEST_F(ResolvconfTest, GetsTheDomainInItsBaseFileAndUpdates) {
  Add();
  EXPECT_EQ(testsupport::ReadFile(kBase), "search corp.example\n");
  EXPECT_EQ(Calls(), "-u\n");
  EXPECT_EQ(testsupport::ReadFile(kMade), "search corp.example\n");
}

TEST_F(ResolvconfTest, KeepsTheRestOfItsBaseFile) {
  testsupport::WriteFile(kBase, "# base\nnameserver 10.0.0.9\nsearch a.example\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kBase), "# base\nnameserver 10.0.0.9\nsearch a.example corp.example\n");
}

TEST_F(ResolvconfTest, AddingTwiceChangesNothing) {
  Add();
  Add("CORP.example.");
  EXPECT_EQ(testsupport::ReadFile(kBase), "search corp.example\n");
  EXPECT_EQ(Calls(), "-u\n");
}

TEST_F(ResolvconfTest, GetsTheDomainInItsTailFileWhereThatOverrules) {
  testsupport::WriteFile(kTail, "search tail.example\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kTail), "search tail.example corp.example\n");
  EXPECT_EQ(testsupport::ReadFile(kBase), "");
}

TEST_F(ResolvconfTest, TakesTheHostsOwnDomainOver) {
  testsupport::SetHostName("host.own.example");
  testsupport::WriteFile(kMade, "nameserver 10.0.0.1\n");
  Add();
  EXPECT_EQ(testsupport::ReadFile(kBase), "search own.example corp.example\n");
}

TEST_F(ResolvconfTest, MakesAMissingBaseFile) {
  testsupport::RemoveFile(kBase);
  Add();
  EXPECT_EQ(testsupport::ReadFile(kBase), "search corp.example\n");
}

TEST_F(ResolvconfTest, AMissingProgramIsReported) {
  testsupport::RemoveFile("/usr/sbin/resolvconf");
  EXPECT_THROW_WHAT(Add(), HostMgmtException, "Unable to run '/sbin/resolvconf': No such file or directory");
  EXPECT_EQ(testsupport::ReadFile(kBase), "search corp.example\n");
}

}  // namespace
