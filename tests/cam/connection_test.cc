// Servers that cannot be reached, or that stop in the middle.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <string>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "support/machine.h"

namespace camtest {
namespace {

using std::chrono::steady_clock;
constexpr std::uint32_t CONNECTION_REFUSED = 1225;
constexpr std::uint32_t NO_ROUTE = 1229;
constexpr std::uint32_t CONNECTION_BROKEN = 10054;
constexpr std::uint32_t TIMED_OUT = 10060;

/// Short for what should end by it, long for what must not be what ends a call.
std::string TimeOuts(int connect, int request) {
  return "connect-timeout = \"" + std::to_string(connect) + "\"\nrequest-timeout = \"" +
         std::to_string(request) + "\"\n";
}
constexpr int SHORT = 1;
constexpr int LONG = 600;

std::uint32_t StatusAt(std::uint16_t port, const std::string& settings,
                       const std::string& server = LOOPBACK) {
  WriteSettings(port, settings);
  return Plugin().GetDomain("", server).status;
}

TEST(CamConnectionTest, ClosedPortIsARefusal) {
  std::uint16_t port = 0;
  close(ListenOnly(&port, 1));
  EXPECT_EQ(StatusAt(port, ""), CONNECTION_REFUSED);
}

TEST(CamConnectionTest, AddressOutsideEveryNetworkIsNoRoute) {
  EXPECT_EQ(StatusAt(8443, "", "198.51.100.1"), NO_ROUTE);
}

TEST(CamConnectionTest, NeighbourThatDoesNotExistIsNoRoute) {
  testsupport::AddInterface("lan0", "192.0.2.1");
  EXPECT_EQ(StatusAt(8443, TimeOuts(LONG, LONG), "192.0.2.77"), NO_ROUTE);
}

TEST(CamConnectionTest, ServerThatNeverAcceptsEndsWithTheConnectTimeOut) {
  std::uint16_t port = 0;
  const int listener = ListenOnly(&port, 8);
  EXPECT_EQ(StatusAt(port, TimeOuts(SHORT, LONG)), TIMED_OUT);
  close(listener);
}

TEST(CamConnectionTest, ConnectTimeOutIsBoundedByTheWholeOne) {
  std::uint16_t port = 0;
  const int listener = ListenOnly(&port, 8);
  EXPECT_EQ(StatusAt(port, TimeOuts(LONG, SHORT)), TIMED_OUT);
  close(listener);
}

TEST(CamConnectionTest, ServerThatNeverAnswersEndsWithTheWholeTimeOut) {
  TlsServer server(Identity(), [](Connection& connection) { connection.AwaitEnd(); });
  const auto start = steady_clock::now();
  EXPECT_EQ(StatusAt(server.Port(), TimeOuts(LONG, SHORT)), TIMED_OUT);
  EXPECT_GE(steady_clock::now() - start, std::chrono::seconds(SHORT));
}

TEST(CamConnectionTest, AnswerThatTricklesEndsWithTheWholeTimeOut) {
  TlsServer server(Identity(), [](Connection& connection) {
    connection.ReadRequest();
    connection.Send("HTTP/1.1 200 OK\r\nContent-Length: 60000\r\n\r\n");
    while (connection.Send(" ")) std::this_thread::sleep_for(std::chrono::milliseconds(50));
  });
  EXPECT_EQ(StatusAt(server.Port(), TimeOuts(LONG, SHORT)), TIMED_OUT);
}

TEST(CamConnectionTest, HandshakeThatStopsEndsWithTheConnectTimeOut) {
  std::uint16_t port = 0;
  const int listener = ListenOnly(&port, 1);
  std::thread server([listener] {
    const int connection = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    char bytes[4096];
    while (recv(connection, bytes, sizeof bytes, 0) > 0) {
    }
    close(connection);
  });
  EXPECT_EQ(StatusAt(port, TimeOuts(SHORT, LONG)), TIMED_OUT);
  server.join();
  close(listener);
}

TEST(CamConnectionTest, ServerThatDiesInTheMiddleIsABrokenConnection) {
  TlsServer server(Identity(), [](Connection& connection) {
    connection.ReadRequest();
    const linger atOnce{1, 0};
    setsockopt(connection.Descriptor(), SOL_SOCKET, SO_LINGER, &atOnce, sizeof atOnce);
    shutdown(connection.Descriptor(), SHUT_RDWR);
  });
  EXPECT_EQ(StatusAt(server.Port(), ""), CONNECTION_BROKEN);
}

TEST(CamConnectionTest, AnswerThatIsNoTlsIsABrokenConnection) {
  TlsServer server(Identity(), [](Connection& connection) {
    connection.ReadRequest();
    const std::string garbage = "this is no record of TLS";
    send(connection.Descriptor(), garbage.data(), garbage.size(), MSG_NOSIGNAL);
    connection.AwaitEnd();
  });
  EXPECT_EQ(StatusAt(server.Port(), ""), CONNECTION_BROKEN);
}

TEST(CamConnectionTest, ServerThatHangsUpInTheHandshakeIsABrokenConnection) {
  std::uint16_t port = 0;
  const int listener = ListenOnly(&port, 1);
  std::thread server([listener] { close(accept4(listener, nullptr, nullptr, SOCK_CLOEXEC)); });
  EXPECT_EQ(StatusAt(port, ""), CONNECTION_BROKEN);
  server.join();
  close(listener);
}

}  // namespace
}  // namespace camtest
