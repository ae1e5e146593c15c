#include "velmor/kerberos.h"

#include <gtest/gtest.h>
#include <krb5/krb5.h>

#include <cstdlib>
#include <string>

#include "support/files.h"

namespace velmor {
namespace {

// The files that the Kerberos library reads, in order.
std::string ConfigurationFiles() {
  return std::getenv("KRB5_CONFIG");
}

std::string OwnConfiguration() {
  const std::string files = ConfigurationFiles();
  return testsupport::ReadFile(files.substr(0, files.find(':')));
}

constexpr char startOfConfiguration[] =
    "[libdefaults]\n  rdns = false\n  dns_canonicalize_hostname = false\n  dns_lookup_kdc = true\n";

TEST(DirectKerberosToTest, TheControllerServesTheRealm) {
  DirectKerberosTo("CORP.EXAMPLE", "dc1.corp.example");
  EXPECT_EQ(OwnConfiguration(), std::string(startOfConfiguration) +
                                    "[realms]\n  CORP.EXAMPLE = {\n    kdc = dc1.corp.example\n  }\n");
}

TEST(DirectKerberosToTest, WithoutAControllerDnsNamesThem) {
  DirectKerberosTo("CORP.EXAMPLE", "");
  EXPECT_EQ(OwnConfiguration(), startOfConfiguration);
}

TEST(DirectKerberosToTest, TheHostsOwnConfigurationCountsAfterwards) {
  DirectKerberosTo("CORP.EXAMPLE", "");
  EXPECT_EQ(ConfigurationFiles().substr(ConfigurationFiles().find(':')), ":/etc/krb5.conf");
}

TEST(LogOnTest, AControllerThatDoesNotAnswerIsReportedAsSuch) {
  DirectKerberosTo("CORP.EXAMPLE", "127.0.0.1");
  try {
    LogOn("CORP.EXAMPLE", "alice", NameForm::OfTheRealm, Secret(std::string_view("secret")));
    ADD_FAILURE() << "a log-on without a controller";
  } catch (const KerberosError& error) {
    EXPECT_EQ(error.Code(), KRB5_KDC_UNREACH);
    EXPECT_STREQ(error.what(), "Cannot contact any KDC for realm 'CORP.EXAMPLE'");
  }
}

}  // namespace
}  // namespace velmor
