// What the host must be called to join a domain, and how its name resolution is repaired.

#include <gtest/gtest.h>
#include <netdb.h>
#include <syslog.h>

#include <cerrno>
#include <iterator>
#include <sstream>
#include <string>
#include <vector>

#include "authentication/authentication.h"
#include "hostmgmt/host_management_exception.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/interpose.h"
#include "support/log_recorder.h"
#include "support/machine.h"

namespace quenix::authentication {
namespace {

using testsupport::LogLine;
using testsupport::ReadFile;
using testsupport::RecordedLog;
using testsupport::TakeOver;
using testsupport::WriteFile;
namespace calls = testsupport::calls;

using Lines = std::vector<LogLine>;
using Words = std::vector<std::string>;

constexpr const char* ADDRESS = "192.0.2.7";
const std::string INVALID = "The current hostname is invalid: ";
const std::string RESOLV_CONF = "nameserver 127.0.0.1\noptions timeout:1 attempts:1\n";

class HostNameTest : public ::testing::Test {
 protected:
  HostNameTest() {
    testsupport::AddInterface("net0", ADDRESS);
    WriteFile("/etc/resolv.conf", RESOLV_CONF);
  }

  /// Gives the host a name, and lines to resolve it by.
  static void Name(const std::string& name, const std::string& hosts) {
    testsupport::SetHostName(name);
    WriteFile("/etc/hosts", hosts);
  }

  void Sanitise(const std::string& domain = "example.test") { store_.SanitiseHostnameForDomain(domain); }

  /// The words of the hosts file's lines for the management address.
  static std::vector<Words> Entries() {
    std::vector<Words> entries;
    std::istringstream lines(ReadFile("/etc/hosts"));
    for (std::string line; std::getline(lines, line);) {
      std::istringstream words(line);
      const Words entry{std::istream_iterator<std::string>(words), {}};
      if (!entry.empty() && entry[0] == ADDRESS) {
        entries.push_back(entry);
      }
    }
    return entries;
  }

  static std::string Resolver() { return ReadFile("/etc/resolv.conf"); }

  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  const ActiveDirectoryStore store_{60};
};

TEST_F(HostNameTest, AFullNameInsideTheDomainNeedsNoRepair) {
  Name("host1", "192.0.2.7 host1.example.test host1\n");
  Sanitise();
  EXPECT_TRUE(RecordedLog().empty());
  EXPECT_EQ(Resolver(), RESOLV_CONF);
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.example.test", "host1"}}));
}

TEST_F(HostNameTest, TheManagementAddressGetsItsEntry) {
  Name("host1", "127.0.1.1 host1.example.test host1\n");
  Sanitise();
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.example.test", "host1"}}));
}

TEST_F(HostNameTest, ANameWithoutDotBecomesTheExpectedOne) {
  Name("host1", "127.0.1.1 host1\n");
  Sanitise();
  EXPECT_TRUE(RecordedLog().empty());
  EXPECT_EQ(Resolver(), RESOLV_CONF);
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.example.test", "host1"}}));
}

TEST_F(HostNameTest, LetterCaseOfTheDomainDoesNotMatter) {
  Name("host1", "127.0.1.1 host1.EXAMPLE.TEST host1\n");
  Sanitise();
  EXPECT_TRUE(RecordedLog().empty());
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.EXAMPLE.TEST", "host1"}}));
}

TEST_F(HostNameTest, LetterCaseOfTheShortNameMatters) {
  Name("host1", "127.0.1.1 HOST1.example.test host1\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "shortname does not match FQDN");
  EXPECT_TRUE(Entries().empty());
}

TEST_F(HostNameTest, ADottedHostNameIsCutAtItsFirstDot) {
  Name("host1.sub.example.test", "127.0.1.1 host1.sub.example.test\n");
  Sanitise("sub.example.test");
  EXPECT_TRUE(RecordedLog().empty());
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.sub.example.test", "host1"}}));
}

TEST_F(HostNameTest, ADottedHostNameThatResolvesToAnotherFirstLabelIsRefused) {
  Name("host1.example.test", "127.0.1.1 other.example.test host1.example.test\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "shortname does not match FQDN");
}

TEST_F(HostNameTest, AnotherDomainIsLoggedAndTheSearchDomainAddedWhenItResolves) {
  Name("host1", "127.0.1.1 host1.other.test host1\n192.0.2.99 example.test\n");
  Sanitise();
  EXPECT_EQ(RecordedLog(),
            (Lines{{LOG_WARNING,
                    "The fully qualified hostname host1.other.test does not match the expected value "
                    "host1.example.test\n"}}));
  EXPECT_NE(Resolver().find("search example.test\n"), std::string::npos) << Resolver();
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.other.test", "host1"}}));
}

TEST_F(HostNameTest, AShorterOrLongerDomainIsAnotherOne) {
  for (const std::string domain : {"example", "example.test2"}) {
    testsupport::ForgetLog();
    Name("host1", "127.0.1.1 host1." + domain + " host1\n");
    Sanitise();
    EXPECT_EQ(RecordedLog().size(), 1U) << domain;
  }
}

TEST_F(HostNameTest, ADomainThatDoesNotResolveLeavesTheResolverAlone) {
  Name("host1", "127.0.1.1 host1.other.test host1\n");
  Sanitise();
  EXPECT_EQ(RecordedLog().size(), 1U);
  EXPECT_EQ(Resolver(), RESOLV_CONF);
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, "host1.other.test", "host1"}}));
}

TEST_F(HostNameTest, TheDomainItselfIsLookedUp) {
  std::vector<std::string> names;
  const TakeOver watch(calls::gethostbyname, [&](const char* name) {
    names.push_back(name);
    return calls::gethostbyname.Real(name);
  });
  Name("host1", "127.0.1.1 host1.other.test host1\n");
  Sanitise();
  EXPECT_EQ(names, (Words{"example.test"}));
}

TEST_F(HostNameTest, TheLogLineComesBeforeTheDomainIsLookedUp) {
  std::size_t lines = 0;
  const TakeOver watch(calls::gethostbyname, [&](const char*) -> hostent* {
    lines = RecordedLog().size();
    return nullptr;
  });
  Name("host1", "127.0.1.1 host1.other.test host1\n");
  Sanitise();
  EXPECT_EQ(lines, 1U);
}

class BlacklistTest : public HostNameTest, public ::testing::WithParamInterface<const char*> {};

TEST_P(BlacklistTest, IsRefused) {
  const std::string name = GetParam();
  Name(name, "127.0.0.1 " + name + "\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "hostname is in blacklist");
  EXPECT_TRUE(Entries().empty());
}

TEST_P(BlacklistTest, IsRefusedWithADomainToo) {
  const std::string name = GetParam();
  Name(name + ".example.test", "127.0.0.1 " + name + ".example.test\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "hostname is in blacklist");
}

TEST_P(BlacklistTest, IsAcceptedInMixedCase) {
  std::string name = GetParam();
  name[1] = static_cast<char>(name[1] - 'a' + 'A');
  Name(name, "127.0.0.1 " + name + "\n");
  Sanitise();
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, name + ".example.test", name}}));
}

TEST_P(BlacklistTest, IsAcceptedAsTheStartOfALongerName) {
  const std::string name = GetParam() + std::string("1");
  Name(name, "127.0.0.1 " + name + "\n");
  Sanitise();
  EXPECT_EQ(Entries().size(), 1U);
}

INSTANTIATE_TEST_SUITE_P(Names, BlacklistTest, ::testing::Values("localhost", "linux", "hostname"),
                         [](const auto& name) { return std::string(name.param); });

TEST_F(HostNameTest, TheBlacklistComesAfterTheResolverWasRepaired) {
  Name("linux", "127.0.0.1 linux.other.test linux\n192.0.2.99 example.test\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "hostname is in blacklist");
  EXPECT_EQ(RecordedLog().size(), 1U);
  EXPECT_NE(Resolver().find("search example.test\n"), std::string::npos) << Resolver();
}

TEST_F(HostNameTest, AShortNameThatDoesNotMatchComesBeforeTheResolverIsRepaired) {
  Name("host1", "127.0.1.1 other.other.test host1\n192.0.2.99 example.test\n");
  EXPECT_THROW(Sanitise(), InvalidHostNameException);
  EXPECT_TRUE(RecordedLog().empty());
  EXPECT_EQ(Resolver(), RESOLV_CONF);
}

TEST_F(HostNameTest, ANameThatTheSystemRefusesIsAnError) {
  const TakeOver refuse(calls::gethostname, [](char*, std::size_t) {
    errno = ENAMETOOLONG;
    return -1;
  });
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "unable to get hostname");
}

TEST_F(HostNameTest, TheSystemIsAskedWithSixtyFourBytes) {
  std::size_t size = 0;
  const TakeOver watch(calls::gethostname, [&](char*, std::size_t length) {
    size = length;
    return -1;
  });
  EXPECT_THROW(Sanitise(), InvalidHostNameException);
  EXPECT_EQ(size, 64U);
}

TEST_F(HostNameTest, ANameThatFillsTheBufferIsReadToItsEndAndNoFurther) {
  const std::string name(64, 'h');
  std::string asked;
  const TakeOver fill(calls::gethostname, [&](char* buffer, std::size_t length) {
    name.copy(buffer, length);
    return 0;
  });
  const TakeOver watch(calls::gethostbynameR,
                       [&](const char* host, hostent*, char*, std::size_t, hostent** found, int*) {
                         asked = host;
                         *found = nullptr;
                         return 0;
                       });
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "hostname cannot be resolved");
  EXPECT_EQ(asked, name);
}

TEST_F(HostNameTest, ANameOfSixtyFourCharactersIsTakenAsTheSystemLeavesIt) {
  Name(std::string(64, 'h'), "127.0.0.1 localhost\n");
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "unable to get hostname");
}

TEST_F(HostNameTest, ANameOfSixtyThreeCharactersIsAccepted) {
  const std::string name(63, 'h');
  Name(name, "127.0.1.1 " + name + "\n");
  Sanitise();
  EXPECT_EQ(Entries(), (std::vector<Words>{{ADDRESS, name + ".example.test", name}}));
}

TEST_F(HostNameTest, AResolverThatFailsGivesItsText) {
  Name("host1", "");
  const TakeOver refuse(calls::gethostbynameR,
                        [](const char*, hostent*, char*, std::size_t, hostent** found, int* error) {
                          *found = nullptr;
                          *error = TRY_AGAIN;
                          return EAGAIN;
                        });
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + hstrerror(TRY_AGAIN));
}

TEST_F(HostNameTest, AResolverThatFindsNothingIsAnError) {
  Name("host1", "");
  const TakeOver findNothing(calls::gethostbynameR,
                             [](const char*, hostent*, char*, std::size_t, hostent** found, int* error) {
                               *found = nullptr;
                               *error = HOST_NOT_FOUND;
                               return 0;
                             });
  EXPECT_THROW_WHAT(Sanitise(), InvalidHostNameException, INVALID + "hostname cannot be resolved");
}

TEST_F(HostNameTest, TheResolverIsAskedWithTheWholeHostNameAndAWorkBufferOf1024Bytes) {
  Name("host1.example.test", "");
  std::string asked;
  std::size_t size = 0;
  const TakeOver watch(calls::gethostbynameR,
                       [&](const char* host, hostent*, char*, std::size_t length, hostent** found, int*) {
                         asked = host;
                         size = length;
                         *found = nullptr;
                         return 0;
                       });
  EXPECT_THROW(Sanitise(), InvalidHostNameException);
  EXPECT_EQ(asked, "host1.example.test");
  EXPECT_EQ(size, 1024U);
}

TEST_F(HostNameTest, AnUnreadableHostsFileFailsBeforeTheHostNameIsAsked) {
  bool asked = false;
  const TakeOver watch(calls::gethostname, [&](char* name, std::size_t length) {
    asked = true;
    return calls::gethostname.Real(name, length);
  });
  testsupport::RemoveFile("/etc/hosts");
  testsupport::MakeFolders("/etc/hosts");
  EXPECT_THROW(Sanitise(), HostMgmt::Lib::HostMgmtException);
  EXPECT_FALSE(asked);
}

TEST_F(HostNameTest, AResolverThatCannotBeRepairedIsThePlatformsErrorAndEndsTheCheck) {
  Name("host1", "127.0.1.1 host1.other.test host1\n192.0.2.99 example.test\n");
  const TakeOver refuse(calls::rename, [](const char* from, const char* to) {
    if (to != std::string("/etc/resolv.conf")) {
      return calls::rename.Real(from, to);
    }
    errno = EROFS;
    return -1;
  });
  EXPECT_THROW(Sanitise(), HostMgmt::Lib::HostMgmtException);
  EXPECT_TRUE(Entries().empty());
}

TEST(HostNameWithoutInterfaceTest, TheRepairedResolverStays) {
  testsupport::UseScriptedPlugin();
  const ActiveDirectoryStore store(60);
  testsupport::SetHostName("host1");
  WriteFile("/etc/hosts", "127.0.1.1 host1.other.test host1\n192.0.2.99 example.test\n");
  EXPECT_THROW(store.SanitiseHostnameForDomain("example.test"), HostMgmt::Lib::HostMgmtException);
  EXPECT_NE(ReadFile("/etc/resolv.conf").find("search example.test\n"), std::string::npos);
}

TEST(HostNameWithoutInterfaceTest, TheMissingManagementAddressIsThePlatformsError) {
  testsupport::UseScriptedPlugin();
  const ActiveDirectoryStore store(60);
  testsupport::SetHostName("host1");
  WriteFile("/etc/hosts", "127.0.1.1 host1.example.test host1\n");
  EXPECT_THROW(store.SanitiseHostnameForDomain("example.test"), HostMgmt::Lib::HostMgmtException);
  EXPECT_EQ(ReadFile("/etc/hosts"), "127.0.1.1 host1.example.test host1\n");
}

}  // namespace
}  // namespace quenix::authentication
