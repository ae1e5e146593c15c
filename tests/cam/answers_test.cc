// What the plug-in asks, and what it makes of the service's answers.
#include <gtest/gtest.h>

#include <cstddef>
#include <ostream>
#include <string>
#include <vector>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "support/log_recorder.h"

namespace camtest {
namespace {

using testsupport::LogLine;
using testsupport::RecordedLog;

constexpr std::uint32_t INVALID_DATA = 13;
constexpr std::uint32_t CONNECTION_BROKEN = 10054;

const DomainResult DOMAIN{0, "CORP", "corp.example", "S-1-5-21-1-2-3"};

DomainResult DomainFrom(const std::string& answer) {
  TlsServer server(Identity(), Answering(answer));
  WriteSettings(server.Port());
  return Plugin().GetDomain();
}

AccountResult AccountFrom(const std::string& answer) {
  TlsServer server(Identity(), Answering(answer));
  WriteSettings(server.Port());
  return Plugin().Create("host2.corp.example");
}

std::string Refusal(const std::string& statusLine, const std::string& status) {
  return HttpAnswer(statusLine, R"({"status": )" + status + R"(, "text": "the reason"})");
}

TEST(CamAnswersTest, DomainIsReadFromTheAnswer) {
  EXPECT_EQ(DomainFrom(HttpAnswer("200 OK", DOMAIN_BODY)), DOMAIN);
}

TEST(CamAnswersTest, ChunkedAnswerIsRead) {
  const std::string body = "5d\r\n" + DOMAIN_BODY + "\r\n0\r\n\r\n";
  ASSERT_EQ(DOMAIN_BODY.size(), 0x5dU);
  EXPECT_EQ(DomainFrom("HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n" + body), DOMAIN);
}

TEST(CamAnswersTest, FieldsThatThePlugInDoesNotKnowAreIgnored) {
  const std::string body = R"({"new": [1], )" + DOMAIN_BODY.substr(1);
  EXPECT_EQ(DomainFrom(HttpAnswer("200 OK", body)), DOMAIN);
}

TEST(CamAnswersTest, DomainIsAskedWithAGet) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  Plugin().GetDomain();
  EXPECT_EQ(server.RequestsOf(1).at(0),
            "GET /v1/domain HTTP/1.1\r\nHost: 127.0.0.1:" + std::to_string(server.Port()) +
                "\r\nAccept: application/json\r\nConnection: close\r\n\r\n");
}

TEST(CamAnswersTest, AccountIsReadFromTheAnswer) {
  EXPECT_EQ(AccountFrom(HttpAnswer("201 Created", ACCOUNT_BODY)), (AccountResult{0, "HOST2$", "QmxvYg=="}));
}

std::string BodyOfCreation(const char* container) {
  TlsServer server(Identity(), Answering(HttpAnswer("201 Created", ACCOUNT_BODY)));
  WriteSettings(server.Port());
  Plugin().Create("host2.corp.example", "", container);
  const std::string request = server.RequestsOf(1).at(0);
  EXPECT_TRUE(request.starts_with("POST /v1/computers HTTP/1.1\r\n"));
  return request.substr(request.find("\r\n\r\n") + 4);
}

TEST(CamAnswersTest, CreationNamesTheHostAndTheContainer) {
  EXPECT_EQ(BodyOfCreation("OU=Hosts"), R"({"hostName":"host2.corp.example","container":"OU=Hosts"})");
}

TEST(CamAnswersTest, CreationWithoutAContainerLeavesItOut) {
  EXPECT_EQ(BodyOfCreation(nullptr), R"({"hostName":"host2.corp.example"})");
}

TEST(CamAnswersTest, QuotesInTheContainerAreEscaped) {
  EXPECT_EQ(BodyOfCreation("OU=\"a\\b\""), R"({"hostName":"host2.corp.example","container":"OU=\"a\\b\""})");
}

TEST(CamAnswersTest, ContainerThatIsNotUtf8IsRefusedWithoutARequest) {
  TlsServer server(Identity(), Answering(HttpAnswer("201 Created", ACCOUNT_BODY)));
  WriteSettings(server.Port());
  EXPECT_EQ(Plugin().Create("host2", "", "OU=\xff").status, 87U);
  EXPECT_EQ(server.Connections(), 0U);
}

struct RefusalRow {
  const char* name;
  const char* statusLine;
  const char* status;
  std::uint32_t expected;

  friend std::ostream& operator<<(std::ostream& stream, const RefusalRow& row) { return stream << row.name; }
};

class CamRefusalTest : public testing::TestWithParam<RefusalRow> {};

TEST_P(CamRefusalTest, StatusOfTheServiceIsReported) {
  EXPECT_EQ(AccountFrom(Refusal(GetParam().statusLine, GetParam().status)).status, GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(
    Rows, CamRefusalTest,
    testing::Values(RefusalRow{"BadRequest", "400 Bad Request", "87", 87},
                    RefusalRow{"BadComputerName", "400 Bad Request", "1210", 1210},
                    RefusalRow{"BadContainer", "400 Bad Request", "267", 267},
                    RefusalRow{"TokenWanted", "401 Unauthorized", "1326", 1326},
                    RefusalRow{"NotAllowed", "403 Forbidden", "5", 5},
                    RefusalRow{"NoSuchPath", "404 Not Found", "50", 50},
                    RefusalRow{"AccountExists", "409 Conflict", "2224", 2224},
                    RefusalRow{"CreationUnderWay", "409 Conflict", "1061", 1061},
                    RefusalRow{"TooOften", "429 Too Many Requests", "1816", 1816},
                    RefusalRow{"CreationFailed", "500 Internal Server Error", "2691", 2691},
                    RefusalRow{"NoController", "502 Bad Gateway", "1311", 1311},
                    RefusalRow{"LargestStatus", "500 Internal Server Error", "4294967295", 4294967295},
                    RefusalRow{"StatusZero", "500 Internal Server Error", "0", INVALID_DATA},
                    RefusalRow{"StatusTooLarge", "500 Internal Server Error", "4294967296", INVALID_DATA},
                    RefusalRow{"NegativeStatus", "500 Internal Server Error", "-5", INVALID_DATA},
                    RefusalRow{"StatusAsText", "500 Internal Server Error", "\"5\"", INVALID_DATA},
                    RefusalRow{"SuccessOfTheWrongKind", "200 OK", "0", INVALID_DATA}),
    [](const auto& row) { return std::string(row.param.name); });

TEST(CamAnswersTest, ReasonOfARefusalIsLogged) {
  AccountFrom(Refusal("403 Forbidden", "5"));
  EXPECT_EQ(RecordedLog(),
            (std::vector<LogLine>{{LOG_ERR,
                                   "CAM server 127.0.0.1: it refused with status 5 (HTTP status "
                                   "403): the reason"}}));
}

TEST(CamAnswersTest, ReasonIsLoggedAsOneShortLineOfPlainCharacters) {
  const std::string text = "a\\nCAM server 1.2.3.4: forged\\u001b[2J" + std::string(1000, 'x');
  AccountFrom(HttpAnswer("403 Forbidden", R"({"status": 5, "text": ")" + text + "\"}"));
  const std::string line = RecordedLog().at(0).text;
  EXPECT_EQ(line.find_first_of("\n\x1b"), std::string::npos);
  EXPECT_LT(line.size(), 300U);
}

struct BadAnswerRow {
  const char* name;
  std::string answer;
  std::uint32_t expected;

  friend std::ostream& operator<<(std::ostream& stream, const BadAnswerRow& row) {
    return stream << row.name;
  }
};

class CamBadAnswerTest : public testing::TestWithParam<BadAnswerRow> {};

TEST_P(CamBadAnswerTest, IsAFailureWithoutResults) {
  EXPECT_EQ(DomainFrom(GetParam().answer), (DomainResult{GetParam().expected, "", "", ""}));
}

std::string DomainAnswer(const std::string& dnsName) {
  return HttpAnswer("200 OK",
                    R"({"netbiosDomainName": "CORP", "domainSid": "S-1", "dnsDomainName": )" + dnsName + "}");
}

INSTANTIATE_TEST_SUITE_P(
    Rows, CamBadAnswerTest,
    testing::Values(
        BadAnswerRow{"NotHttp", "garbage\r\n\r\nmore garbage", INVALID_DATA},
        BadAnswerRow{"Nothing", "", CONNECTION_BROKEN},
        BadAnswerRow{"CutInTheHeader", "HTTP/1.1 200 OK\r\nContent-", CONNECTION_BROKEN},
        BadAnswerRow{"CutInTheBody", "HTTP/1.1 200 OK\r\nContent-Length: 500\r\n\r\n{", CONNECTION_BROKEN},
        BadAnswerRow{"NotJson", HttpAnswer("200 OK", "<html>"), INVALID_DATA},
        BadAnswerRow{"EmptyBody", HttpAnswer("200 OK", ""), INVALID_DATA},
        BadAnswerRow{"Array", HttpAnswer("200 OK", "[]"), INVALID_DATA},
        BadAnswerRow{"DeeplyNested", HttpAnswer("200 OK", std::string(60000, '[')), INVALID_DATA},
        BadAnswerRow{"MissingField", HttpAnswer("200 OK", R"({"netbiosDomainName": "CORP"})"), INVALID_DATA},
        BadAnswerRow{"NumberForText", DomainAnswer("7"), INVALID_DATA},
        BadAnswerRow{"EmptyText", DomainAnswer("\"\""), INVALID_DATA},
        BadAnswerRow{"LineBreakInText", DomainAnswer("\"corp.example\\nnameserver 1.2.3.4\""), INVALID_DATA},
        BadAnswerRow{"ZeroByteInText", DomainAnswer("\"corp\\u0000.example\""), INVALID_DATA},
        BadAnswerRow{"BlankInText", DomainAnswer("\"corp example\""), INVALID_DATA},
        BadAnswerRow{"LongBody", HttpAnswer("200 OK", std::string(70000, ' ') + DOMAIN_BODY), INVALID_DATA},
        BadAnswerRow{"AnnouncedLongBody", "HTTP/1.1 200 OK\r\nContent-Length: 99999999999\r\n\r\n{",
                     INVALID_DATA},
        BadAnswerRow{"LongHeader",
                     HttpAnswer("200 OK", DOMAIN_BODY, "X: " + std::string(20000, 'x') + "\r\n"),
                     INVALID_DATA},
        BadAnswerRow{"FailureWithoutJson", HttpAnswer("502 Bad Gateway", "<html>"), INVALID_DATA},
        BadAnswerRow{"FailureWithoutStatus", HttpAnswer("400 Bad Request", "{}"), INVALID_DATA}),
    [](const auto& row) { return std::string(row.param.name); });

TEST(CamAnswersTest, EndlessAnswerIsCutOff) {
  TlsServer server(Identity(), [](Connection& connection) {
    connection.ReadRequest();
    connection.Send("HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n");
    while (connection.Send("400\r\n" + std::string(0x400, ' ') + "\r\n")) {
    }
  });
  WriteSettings(server.Port());
  EXPECT_EQ(Plugin().GetDomain().status, INVALID_DATA);
}

TEST(CamAnswersTest, RedirectionIsNotFollowed) {
  TlsServer elsewhere(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  const std::string location =
      "Location: https://127.0.0.1:" + std::to_string(elsewhere.Port()) + "/v1/domain\r\n";
  EXPECT_EQ(DomainFrom(HttpAnswer("302 Found", "{}", location)).status, INVALID_DATA);
  EXPECT_EQ(elsewhere.Connections(), 0U);
}

TEST(CamAnswersTest, ContinueIsNotTakenForTheAnswer) {
  EXPECT_EQ(DomainFrom("HTTP/1.1 100 Continue\r\n\r\n" + HttpAnswer("200 OK", DOMAIN_BODY)), DOMAIN);
}

TEST(CamAnswersTest, ServerThatIsNoIPv4AddressIsRefused) {
  for (const char* server : {"localhost", "127.0.0.1:1", "user@127.0.0.1", "::1", ""}) {
    EXPECT_EQ(Plugin().GetDomain("", server).status, 87U) << server;
  }
}

}  // namespace
}  // namespace camtest
