// A host process may set a global locale that groups digits; the library's numbers must not follow it.

#include <gtest/gtest.h>

#include <locale>
#include <sstream>
#include <string>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"

namespace quenix::authentication {
namespace {

class Grouping : public std::numpunct<char> {
 protected:
  char do_thousands_sep() const override { return ','; }
  std::string do_grouping() const override { return "\1"; }
};

class LocaleTest : public ::testing::Test {
 protected:
  LocaleTest() : previous_(std::locale::global(std::locale(std::locale(), new Grouping))) {
    std::ostringstream stream;
    stream << 1234;
    EXPECT_EQ(stream.str(), "1,2,3,4");
  }
  ~LocaleTest() override { std::locale::global(previous_); }

 private:
  std::locale previous_;
};

TEST_F(LocaleTest, CodesAreNotGrouped) {
  EXPECT_STREQ(Exception(0x123456789abcUL, "m").what(), "Exception 0x123456789abc: m");
  EXPECT_STREQ(UnknownException(1063).what(), "Exception 0x00000427: Unknown exception");
}

TEST_F(LocaleTest, LineNumbersAreNotGrouped) {
  testsupport::WriteFile(testsupport::PROVIDER_CONF, std::string(1233, '\n') + "x\n");
  EXPECT_THROW_WHAT(ProviderConfiguration(), ConfigurationError,
                    "Error parsing configuration on line 1234: no delimiter found");
  testsupport::WriteFile(testsupport::PROVIDER_CONF, std::string(1233, '\n') + "x = '\n");
  EXPECT_THROW_WHAT(ProviderConfiguration(), ConfigurationError,
                    "Error parsing configuration at line 1234: invalid quoting");
}

TEST_F(LocaleTest, VersionsAreNotGrouped) {
  testsupport::InstallPlugin("version1234567");
  testsupport::ConfigureProvider("version1234567");
  EXPECT_THROW_WHAT(
      ActiveDirectoryStore(60), InvalidActiveDirectoryProviderException,
      "The specified Active Directory provider 'version1234567' is invalid: The API version (1234567) "
      "is not supported by this version of libvelmor");
}

TEST_F(LocaleTest, TheStreamsFormatOfADomainStays) {
  std::ostringstream stream;
  stream << Domain("1000.test", "1000");
  EXPECT_EQ(stream.str(), "DNS Name: 1000.test, NetBIOS Name: 1000");
}

TEST_F(LocaleTest, SettingsAreWrittenAndReadAsBytes) {
  testsupport::WriteFile(testsupport::PROVIDER_CONF, "provider = \"x\"\n");
  ProviderConfiguration configuration;
  configuration["provider"] = "\xc3\xa4\xff 1234";
  configuration.Write();
  EXPECT_EQ(testsupport::ReadFile(testsupport::PROVIDER_CONF), "provider = \"\xc3\xa4\xff 1234\"\n");
  EXPECT_EQ(ProviderConfiguration()["provider"], "\xc3\xa4\xff 1234");
}

}  // namespace
}  // namespace quenix::authentication
