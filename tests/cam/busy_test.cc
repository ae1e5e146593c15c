// A service that answers 503.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <string>

#include "cam/plugin.h"
#include "cam/tls_server.h"

namespace camtest {
namespace {

using std::chrono::steady_clock;
constexpr std::uint32_t TIMED_OUT = 10060;

std::string Busy(const std::string& fields) {
  return HttpAnswer("503 Service Unavailable", R"({"status": 170, "text": "too many requests"})", fields);
}

/// Busy at first, then with another answer.
class BusyOnce {
 public:
  explicit BusyOnce(std::string fields, std::string then = HttpAnswer("201 Created", ACCOUNT_BODY))
      : fields_(std::move(fields)), then_(std::move(then)) {}
  void operator()(Connection& connection) {
    connection.ReadRequest();
    connection.Send(asked_++ == 0 ? Busy(fields_) : then_);
  }

 private:
  std::string fields_;
  std::string then_;
  int asked_ = 0;
};

struct Outcome {
  AccountResult result;
  steady_clock::duration lasted;
};

Outcome CreateAt(TlsServer& server, const std::string& settings) {
  WriteSettings(server.Port(), settings);
  const auto start = steady_clock::now();
  AccountResult result = Plugin().Create("host2");
  return {std::move(result), steady_clock::now() - start};
}

TEST(CamBusyTest, IsAskedAgainAfterTheTimeThatItSays) {
  TlsServer server(Identity(), BusyOnce("Retry-After: 2\r\n"));
  const auto [result, lasted] = CreateAt(server, "request-timeout = \"60\"\n");
  EXPECT_EQ(result.status, 0U);
  EXPECT_GE(lasted, std::chrono::seconds(2));
}

TEST(CamBusyTest, IsAskedAgainWithTheSameRequest) {
  TlsServer server(Identity(), BusyOnce("Retry-After: 1\r\n"));
  CreateAt(server, "");
  const auto requests = server.RequestsOf(2);
  ASSERT_EQ(requests.size(), 2U);
  EXPECT_EQ(requests[0], requests[1]);
}

class CamBusyWithoutTimeTest : public testing::TestWithParam<const char*> {};

TEST_P(CamBusyWithoutTimeTest, IsAskedAgainAfterASecond) {
  TlsServer server(Identity{}, BusyOnce(GetParam()));
  const auto [result, lasted] = CreateAt(server, "request-timeout = \"60\"\n");
  EXPECT_EQ(result.status, 0U);
  EXPECT_GE(lasted, std::chrono::seconds(1));
}

INSTANTIATE_TEST_SUITE_P(Rows, CamBusyWithoutTimeTest,
                         testing::Values("", "Retry-After: 0\r\n", "Retry-After: soon\r\n",
                                         "Retry-After: -1\r\n", "Retry-After: 99999999999999\r\n"));

TEST(CamBusyTest, IsReportedAtOnceWhenItsTimeLiesBehindTheTimeOut) {
  TlsServer server(Identity(), Answering(Busy("Retry-After: 3600\r\n")));
  const auto [result, lasted] = CreateAt(server, "request-timeout = \"600\"\n");
  EXPECT_EQ(result.status, TIMED_OUT);
  EXPECT_LT(lasted, std::chrono::seconds(60));
}

TEST(CamBusyTest, IsReportedWhenItStaysBusyUntilTheTimeOut) {
  TlsServer server(Identity(), BusyOnce("Retry-After: 1\r\n", Busy("Retry-After: 60\r\n")));
  EXPECT_EQ(CreateAt(server, "request-timeout = \"60\"\n").result.status, TIMED_OUT);
  EXPECT_EQ(server.RequestsOf(2).size(), 2U);
}

}  // namespace
}  // namespace camtest
