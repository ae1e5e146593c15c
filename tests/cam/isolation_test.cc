// The plug-in is a guest in a foreign process.
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <csignal>
#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "support/files.h"

namespace camtest {
namespace {

constexpr std::uint32_t CONNECTION_BROKEN = 10054;

volatile std::sig_atomic_t brokenPipes = 0;

/// Reads a little, ends its own side and then closes with bytes unread: the client, which has more to send
/// than the sockets can hold, writes on to a connection that is gone.
void HangUpOnAWritingClient(Connection& connection) {
  connection.ReadSome(1);
  shutdown(connection.Descriptor(), SHUT_WR);
  const linger atOnce{1, 0};
  setsockopt(connection.Descriptor(), SOL_SOCKET, SO_LINGER, &atOnce, sizeof atOnce);
}

TEST(CamIsolationTest, ServerThatHangsUpRaisesNoSignal) {
  TlsServer server(Identity(), HangUpOnAWritingClient);
  WriteSettings(server.Port());
  struct sigaction count {};
  count.sa_handler = [](int) { brokenPipes = brokenPipes + 1; };
  sigaction(SIGPIPE, &count, nullptr);
  EXPECT_EQ(Plugin().Create(std::string(32 * 1024 * 1024, 'h')).status, CONNECTION_BROKEN);
  EXPECT_EQ(brokenPipes, 0);
}

TEST(CamIsolationTest, SignalsAreLeftAsTheyWere) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  Plugin().GetDomain();
  struct sigaction action {};
  sigaction(SIGPIPE, nullptr, &action);
  EXPECT_EQ(action.sa_handler, SIG_DFL);
  sigset_t blocked;
  pthread_sigmask(SIG_SETMASK, nullptr, &blocked);
  EXPECT_EQ(sigismember(&blocked, SIGPIPE), 0);
}

TEST(CamIsolationTest, CallsOfSeveralThreadsDoNotMix) {
  TlsServer server(Identity(), [](Connection& connection) {
    const std::string request = connection.ReadRequest();
    const auto start = request.find("host-");
    const std::string name = request.substr(start, request.find('"', start) - start);
    connection.Send(
        HttpAnswer("201 Created", R"({"accountName": ")" + name + R"($", "joinBlob": "of-)" + name + "\"}"));
  });
  WriteSettings(server.Port());
  std::vector<std::thread> threads;
  for (int number = 0; number < 8; ++number) {
    threads.emplace_back([number] {
      const Plugin plugin;
      for (int turn = 0; turn < 5; ++turn) {
        const std::string name = "host-" + std::to_string(number) + "-" + std::to_string(turn);
        EXPECT_EQ(plugin.Create(name), (AccountResult{0, name + "$", "of-" + name}));
      }
    });
  }
  for (auto& thread : threads) thread.join();
}

TEST(CamIsolationTest, ProxiesOfTheEnvironmentAreIgnored) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  for (const char* name : {"https_proxy", "HTTPS_PROXY", "http_proxy", "ALL_PROXY", "all_proxy"}) {
    setenv(name, "http://127.0.0.1:1", 1);
  }
  EXPECT_EQ(Plugin().GetDomain().status, 0U);
}

std::vector<std::string> DescriptorsThatProgramsInherit() {
  std::vector<std::string> names;
  for (const auto& name : testsupport::NamesIn("/proc/self/fd")) {
    const int flags = fcntl(std::stoi(name), F_GETFD);
    if (flags >= 0 && (flags & FD_CLOEXEC) == 0) names.push_back(name);
  }
  return names;
}

TEST(CamIsolationTest, ProgramsStartedDuringACallInheritNothing) {
  const auto before = DescriptorsThatProgramsInherit();
  std::vector<std::string> during;
  TlsServer server(Identity(), [&](Connection& connection) {
    connection.ReadRequest();
    during = DescriptorsThatProgramsInherit();
    connection.Send(HttpAnswer("200 OK", DOMAIN_BODY));
  });
  WriteSettings(server.Port());
  EXPECT_EQ(Plugin().GetDomain().status, 0U);
  EXPECT_EQ(during, before);
}

TEST(CamIsolationTest, CallsLeaveNoDescriptorOpen) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  const Plugin plugin;
  plugin.GetDomain();
  server.RequestsOf(1);
  const auto before = testsupport::NamesIn("/proc/self/fd").size();
  for (std::size_t call = 2; call <= 10; ++call) {
    plugin.GetDomain();
    server.RequestsOf(call);
  }
  EXPECT_EQ(testsupport::NamesIn("/proc/self/fd").size(), before);
}

TEST(CamIsolationTest, PlugInIsUnloadedWhenItIsClosed) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  for (int turn = 0; turn < 3; ++turn) {
    EXPECT_EQ(Plugin().GetDomain().status, 0U);
    EXPECT_EQ(testsupport::ReadFile("/proc/self/maps").find("/libcam.so"), std::string::npos);
  }
}

}  // namespace
}  // namespace camtest
