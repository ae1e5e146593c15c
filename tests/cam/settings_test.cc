// The plug-in's settings file.
#include <gtest/gtest.h>
#include <unistd.h>

#include <ostream>
#include <string>
#include <vector>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "support/files.h"
#include "support/log_recorder.h"

namespace camtest {
namespace {

constexpr std::uint32_t SETTINGS_FAULT = 1064;
constexpr std::uint32_t CONNECTION_REFUSED = 1225;
const std::string TOKEN = "Zm9yIG9uZSBjcmVhdGlvbg";

void WriteWithMode(const std::string& content, unsigned int mode) {
  testsupport::WriteFile(SETTINGS, content);
  testsupport::SetMode(SETTINGS, mode);
}

std::uint32_t StatusWith(const std::string& content, unsigned int mode = 0600) {
  WriteWithMode(content, mode);
  return Plugin().GetDomain().status;
}

std::string LogAfter(const std::string& content) {
  StatusWith(content);
  return testsupport::RecordedLog().at(0).text;
}

TEST(CamSettingsTest, MissingFileStandsForTheDefaults) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)), TLS1_3_VERSION, 8443);
  EXPECT_EQ(Plugin().GetDomain().status, 0U);
}

TEST(CamSettingsTest, EmptyFileStandsForTheDefaults) {
  EXPECT_EQ(StatusWith(""), CONNECTION_REFUSED);
}

TEST(CamSettingsTest, QuotesAndBlankLinesDoNotMatter) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  EXPECT_EQ(StatusWith("\n  port\t=  " + std::to_string(server.Port()) + "  \r\n\nrequest-timeout='5'"), 0U);
}

struct FaultRow {
  const char* name;
  const char* content;
  const char* fault;

  friend std::ostream& operator<<(std::ostream& stream, const FaultRow& row) { return stream << row.name; }
};

class CamSettingsFaultTest : public testing::TestWithParam<FaultRow> {};

TEST_P(CamSettingsFaultTest, IsRefused) {
  EXPECT_EQ(StatusWith(GetParam().content), SETTINGS_FAULT);
}

TEST_P(CamSettingsFaultTest, IsNamedInTheLog) {
  EXPECT_EQ(LogAfter(GetParam().content),
            std::string("CAM server 127.0.0.1: /etc/quenix/velmor/cam.conf: line ") + GetParam().fault);
}

INSTANTIATE_TEST_SUITE_P(
    Rows, CamSettingsFaultTest,
    testing::Values(
        FaultRow{"NoDelimiter", "\nport 8443", "2 has no \"=\""},
        FaultRow{"UnknownKey", "porz = 1", "1 has the unknown key 'porz'"},
        FaultRow{"RepeatedKey", "port = 1\nport = 1", "2 sets 'port' again"},
        FaultRow{"PortZero", "port = 0", "1 needs a number from 1 to 65535"},
        FaultRow{"PortTooLarge", "port = 65536", "1 needs a number from 1 to 65535"},
        FaultRow{"PortWithMore", "port = 84x", "1 needs a number from 1 to 65535"},
        FaultRow{"NoConnectTime", "connect-timeout = 0", "1 needs a number from 1 to 600"},
        FaultRow{"LongRequestTime", "request-timeout = 3601", "1 needs a number from 1 to 3600"},
        FaultRow{"PinOfAName", "sha256-cam.example = 00", "1 needs an IPv4 address behind \"sha256-\""},
        FaultRow{"ShortPin", "sha256-10.0.0.1 = AB:CD", "1 needs a SHA-256 of 64 hexadecimal digits"},
        FaultRow{"BlankInToken", "token = \"a b\"",
                 "1 needs a token of printable characters without blanks"}),
    [](const auto& row) { return std::string(row.param.name); });

TEST(CamSettingsTest, Sha256MayBeWrittenInLowerCaseWithoutColons) {
  const Identity identity;
  TlsServer server(identity, Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  std::string digest = identity.Sha256();
  std::erase(digest, ':');
  for (char& digit : digest) digit = static_cast<char>(tolower(digit));
  WriteSettings(server.Port(), "sha256-127.0.0.1 = " + digest);
  EXPECT_EQ(Plugin().GetDomain(identity.Sha1()).status, 0U);
}

TEST(CamSettingsTest, TokenIsSentWithACreation) {
  TlsServer server(Identity(), Answering(HttpAnswer("201 Created", ACCOUNT_BODY)));
  WriteSettings(server.Port(), "token = \"" + TOKEN + "\"");
  Plugin().Create("host2");
  EXPECT_NE(server.RequestsOf(1).at(0).find("\r\nAuthorization: Bearer " + TOKEN + "\r\n"),
            std::string::npos);
}

TEST(CamSettingsTest, TokenIsNotSentWithAQuestion) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port(), "token = \"" + TOKEN + "\"");
  Plugin().GetDomain();
  EXPECT_EQ(server.RequestsOf(1).at(0).find("Authorization"), std::string::npos);
}

TEST(CamSettingsTest, TokenThatOthersCanReadIsRefused) {
  EXPECT_EQ(StatusWith("token = \"" + TOKEN + "\"", 0640), SETTINGS_FAULT);
  EXPECT_EQ(testsupport::RecordedLog().at(0).text,
            "CAM server 127.0.0.1: /etc/quenix/velmor/cam.conf holds a token and can be read by others than "
            "its owner");
}

TEST(CamSettingsTest, FileWithoutATokenMayBeRead) {
  EXPECT_EQ(StatusWith("connect-timeout = 5", 0644), CONNECTION_REFUSED);
}

TEST(CamSettingsTest, FileThatOthersCanWriteIsRefused) {
  EXPECT_EQ(StatusWith("connect-timeout = 5", 0620), SETTINGS_FAULT);
  EXPECT_EQ(StatusWith("connect-timeout = 5", 0602), SETTINGS_FAULT);
}

TEST(CamSettingsTest, FolderInPlaceOfTheFileIsRefused) {
  testsupport::MakeFolders(SETTINGS);
  EXPECT_EQ(Plugin().GetDomain().status, SETTINGS_FAULT);
}

TEST(CamSettingsTest, OverlongFileIsRefused) {
  EXPECT_EQ(StatusWith(std::string(70000, '\n')), SETTINGS_FAULT);
}

TEST(CamSettingsTest, FaultOfALineDoesNotShowItsValue) {
  EXPECT_EQ(LogAfter("token = \"secret token\"").find("secret"), std::string::npos);
}

TEST(CamSettingsTest, FileIsReadForEachCall) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  const Plugin plugin;
  testsupport::WriteFile(SETTINGS, "broken");
  EXPECT_EQ(plugin.GetDomain().status, SETTINGS_FAULT);
  WriteSettings(server.Port());
  EXPECT_EQ(plugin.GetDomain().status, 0U);
}

}  // namespace
}  // namespace camtest
