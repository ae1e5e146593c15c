// The provider's settings file.

#include "common/settings.h"

#include <gtest/gtest.h>

#include "expect_failure.h"
#include "support/files.h"

namespace sambaprovider {
namespace {

using std::chrono::seconds;

TEST(SettingsTest, AMissingFileStandsForTheDefaults) {
  const Settings settings = LoadSettings();
  EXPECT_FALSE(settings.reuseAccount);
  EXPECT_EQ(settings.winbindRequestTimeout, seconds(15));
  EXPECT_EQ(settings.operationTimeout, seconds(120));
}

TEST(SettingsTest, TheFileIsReadFromItsPlace) {
  testsupport::WriteFile("/etc/quenix/velmor/samba.conf", "reuse-account = \"yes\"\n");
  EXPECT_TRUE(LoadSettings().reuseAccount);
}

TEST(SettingsTest, EveryKeyIsRead) {
  const Settings settings =
      ParseSettings("reuse-account = \"yes\"\n\nwinbind-request-timeout='90'\n operation-timeout =\t30 ");
  EXPECT_TRUE(settings.reuseAccount);
  EXPECT_EQ(settings.winbindRequestTimeout, seconds(90));
  EXPECT_EQ(settings.operationTimeout, seconds(30));
}

TEST(SettingsTest, AFaultNamesItsLine) {
  try {
    ParseSettings("reuse-account = no\n\nnonsense\n");
    ADD_FAILURE();
  } catch (const Failure& failure) {
    EXPECT_EQ(failure.Code(), 1064U);
    EXPECT_STREQ(failure.what(), "/etc/quenix/velmor/samba.conf: line 3 has no \"=\"");
  }
}

TEST(SettingsTest, AnUnknownKeyIsRefused) {
  EXPECT_FAILURE(ParseSettings("reuse = yes"), 1064);
}

TEST(SettingsTest, ARepeatedKeyIsRefused) {
  EXPECT_FAILURE(ParseSettings("reuse-account = yes\nreuse-account = no"), 1064);
}

TEST(SettingsTest, AnImpossibleValueIsRefused) {
  for (const char* line :
       {"reuse-account = maybe", "operation-timeout = 0", "operation-timeout = 3601",
        "operation-timeout = 5s", "winbind-request-timeout = ", "winbind-request-timeout = 1"}) {
    SCOPED_TRACE(line);
    EXPECT_FAILURE(ParseSettings(line), 1064);
  }
}

}  // namespace
}  // namespace sambaprovider
