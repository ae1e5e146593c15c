// Which servers the plug-in talks to.
#include <gtest/gtest.h>
#include <openssl/ssl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "support/files.h"
#include "support/log_recorder.h"

namespace camtest {
namespace {

using testsupport::LogLine;
using testsupport::RecordedLog;

constexpr std::uint32_t WRONG_CERTIFICATE = 0x80090325;
constexpr std::uint32_t NO_COMMON_TLS = 0x80090326;

std::string Pin(const std::string& sha256, const std::string& server = LOOPBACK) {
  return "sha256-" + server + " = \"" + sha256 + "\"\n";
}

struct Outcome {
  std::uint32_t status;
  std::size_t requests;

  bool operator==(const Outcome&) const = default;
};
const Outcome ACCEPTED{0, 1};
const Outcome REFUSED_BEFORE_ANYTHING_WAS_SENT{WRONG_CERTIFICATE, 0};

/// Creates an account at a server with that certificate.
Outcome CreateAt(const Identity& identity, const std::string& thumbprint, const std::string& settings = "",
                 int version = TLS1_3_VERSION) {
  TlsServer server(identity, Answering(HttpAnswer("201 Created", ACCOUNT_BODY)), version);
  WriteSettings(server.Port(), settings);
  const auto status = Plugin().Create("host2", thumbprint).status;
  return {status, server.RequestsOf(1).size()};
}

TEST(CamVerificationTest, ServerWithTheThumbprintIsAccepted) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1()), ACCEPTED);
}

TEST(CamVerificationTest, RsaCertificateIsAccepted) {
  const Identity identity(KeyKind::RSA);
  EXPECT_EQ(CreateAt(identity, identity.Sha1()), ACCEPTED);
}

TEST(CamVerificationTest, AcceptedServerLeavesNoLine) {
  const Identity identity;
  CreateAt(identity, identity.Sha1());
  EXPECT_EQ(RecordedLog(), std::vector<LogLine>{});
}

TEST(CamVerificationTest, ServerWithAnotherThumbprintGetsNothing) {
  EXPECT_EQ(CreateAt(Identity(), Identity().Sha1()), REFUSED_BEFORE_ANYTHING_WAS_SENT);
}

TEST(CamVerificationTest, ServerWithAnotherThumbprintGetsNothingOverTls12) {
  EXPECT_EQ(CreateAt(Identity(), Identity().Sha1(), "", TLS1_2_VERSION), REFUSED_BEFORE_ANYTHING_WAS_SENT);
}

TEST(CamVerificationTest, QuestionForTheDomainIsRefusedTheSameWay) {
  TlsServer server(Identity(), Answering(HttpAnswer("200 OK", DOMAIN_BODY)));
  WriteSettings(server.Port());
  EXPECT_EQ(Plugin().GetDomain(Identity().Sha1()).status, WRONG_CERTIFICATE);
  EXPECT_TRUE(server.RequestsOf(1).empty());
}

TEST(CamVerificationTest, MismatchIsLoggedWithBothThumbprints) {
  const Identity served;
  const Identity expected;
  CreateAt(served, expected.Sha1());
  EXPECT_EQ(RecordedLog(),
            (std::vector<LogLine>{{LOG_ERR, "CAM server 127.0.0.1: its certificate has the SHA-1 " +
                                                served.Sha1() + ", not " + expected.Sha1()}}));
}

TEST(CamVerificationTest, EmptyThumbprintMatchesNoServer) {
  TlsServer server(Identity(), Answering(HttpAnswer("201 Created", ACCOUNT_BODY)));
  WriteSettings(server.Port());
  char* results[2] = {};
  const auto status = Plugin().Operations().createMachineAccount(LOOPBACK.c_str(), "host2", nullptr, 1, "",
                                                                 &results[0], &results[1]);
  EXPECT_EQ(status, WRONG_CERTIFICATE);
  EXPECT_TRUE(server.RequestsOf(1).empty());
}

TEST(CamVerificationTest, BothDigestsTogetherAreAccepted) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), Pin(identity.Sha256())), ACCEPTED);
}

TEST(CamVerificationTest, ServerWithAnotherSha256GetsNothing) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), Pin(Identity().Sha256())), REFUSED_BEFORE_ANYTHING_WAS_SENT);
}

TEST(CamVerificationTest, MatchingSha256DoesNotReplaceTheThumbprint) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, Identity().Sha1(), Pin(identity.Sha256())), REFUSED_BEFORE_ANYTHING_WAS_SENT);
}

TEST(CamVerificationTest, Sha256WithoutAnAddressCountsForEveryServer) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), "sha256 = " + identity.Sha256() + "\n"), ACCEPTED);
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), "sha256 = " + Identity().Sha256() + "\n"),
            REFUSED_BEFORE_ANYTHING_WAS_SENT);
}

TEST(CamVerificationTest, Sha256OfTheServerCountsInPlaceOfTheOneForAll) {
  const Identity identity;
  EXPECT_EQ(
      CreateAt(identity, identity.Sha1(), Pin(identity.Sha256()) + "sha256 = " + Identity().Sha256() + "\n"),
      ACCEPTED);
}

TEST(CamVerificationTest, Sha256OfAnotherServerDoesNotCount) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), Pin(Identity().Sha256(), "127.0.0.2")), ACCEPTED);
}

TEST(CamVerificationTest, CertificatePastItsDateIsAcceptedWithAWarning) {
  const Identity identity = ExpiredIdentity();
  EXPECT_EQ(CreateAt(identity, identity.Sha1()), ACCEPTED);
  EXPECT_EQ(
      RecordedLog(),
      (std::vector<LogLine>{{LOG_WARNING,
                             "CAM server 127.0.0.1: its certificate is past its date; accepted, since it is "
                             "the imported one"}}));
}

TEST(CamVerificationTest, CertificateBeforeItsDateIsAcceptedWithAWarning) {
  const Identity identity(KeyKind::EC, std::chrono::hours(24), std::chrono::hours(48));
  EXPECT_EQ(CreateAt(identity, identity.Sha1()), ACCEPTED);
  EXPECT_EQ(
      RecordedLog(),
      (std::vector<LogLine>{{LOG_WARNING,
                             "CAM server 127.0.0.1: its certificate is not valid yet; accepted, since it is "
                             "the imported one"}}));
}

TEST(CamVerificationTest, NothingIsCheckedWithVerificationOff) {
  EXPECT_EQ(CreateAt(ExpiredIdentity(), "", Pin(Identity().Sha256())), ACCEPTED);
  EXPECT_EQ(RecordedLog(), std::vector<LogLine>{});
}

/// Lets every program of the sandbox speak TLS with these ciphers, of which some need no certificate.
void AllowTlsWithoutCertificates(const std::string& ciphers = "aNULL") {
  testsupport::WriteFile(
      "/etc/openssl-anonymous.cnf",
      "openssl_conf = settings\n[settings]\nssl_conf = tls\n[tls]\nsystem_default = everybody\n"
      "[everybody]\nCipherString = " +
          ciphers + ":@SECLEVEL=0\nMaxProtocol = TLSv1.2\n");
  setenv("OPENSSL_CONF", "/etc/openssl-anonymous.cnf", 1);
}

TEST(CamVerificationTest, ServerWithoutACertificateGetsNothing) {
  AllowTlsWithoutCertificates();
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), "", TLS1_2_VERSION), REFUSED_BEFORE_ANYTHING_WAS_SENT);
  EXPECT_EQ(RecordedLog(),
            (std::vector<LogLine>{{LOG_ERR, "CAM server 127.0.0.1: it showed no certificate"}}));
}

TEST(CamVerificationTest, ServerThatShowsACertificateAtFirstOnlyGetsNothingMore) {
  AllowTlsWithoutCertificates("ALL:+aNULL");
  const Identity identity;
  TlsServer server(identity, [](Connection& connection) {
    connection.HideCertificate();
    connection.ReadRequest();
    connection.Send(HttpAnswer("503 Service Unavailable", R"({"status": 170, "text": "too many requests"})"));
  });
  WriteSettings(server.Port());
  EXPECT_EQ(Plugin().Create("host2", identity.Sha1()).status, WRONG_CERTIFICATE);
  EXPECT_EQ(server.RequestsOf(2).size(), 1U);
}

/// The servers of the tests above do answer those who want no certificate.
TEST(CamVerificationTest, ServerWithoutACertificateIsReal) {
  AllowTlsWithoutCertificates();
  EXPECT_EQ(CreateAt(Identity(), "", "", TLS1_2_VERSION), ACCEPTED);
}

TEST(CamVerificationTest, Tls12IsSpoken) {
  const Identity identity;
  EXPECT_EQ(CreateAt(identity, identity.Sha1(), "", TLS1_2_VERSION), ACCEPTED);
}

TEST(CamVerificationTest, ServerThatSpeaksNoNewerThanTls11IsRefused) {
  EXPECT_EQ(CreateAt(Identity(), "", "", TLS1_1_VERSION), (Outcome{NO_COMMON_TLS, 0}));
}

/// The server of the test above does speak TLS 1.1 to those who want it.
TEST(CamVerificationTest, ServerOfTls11IsReal) {
  TlsServer server(Identity(), Answering("answer"), TLS1_1_VERSION);
  const std::unique_ptr<SSL_CTX, void (*)(SSL_CTX*)> context(SSL_CTX_new(TLS_client_method()), SSL_CTX_free);
  SSL_CTX_set_min_proto_version(context.get(), TLS1_1_VERSION);
  SSL_CTX_set_cipher_list(context.get(), "DEFAULT@SECLEVEL=0");
  std::string target = LOOPBACK + ":" + std::to_string(server.Port());
  const std::unique_ptr<BIO, void (*)(BIO*)> client(BIO_new_ssl_connect(context.get()), BIO_free_all);
  BIO_set_conn_hostname(client.get(), target.data());
  EXPECT_EQ(BIO_do_handshake(client.get()), 1);
}

TEST(CamVerificationTest, ServerThatDoesNotSpeakTlsIsRefused) {
  std::uint16_t port = 0;
  const int listener = ListenOnly(&port, 1);
  std::thread server([listener] {
    const int connection = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    const std::string answer = HttpAnswer("400 Bad Request", "{}");
    send(connection, answer.data(), answer.size(), MSG_NOSIGNAL);
    char bytes[4096];
    while (recv(connection, bytes, sizeof bytes, 0) > 0) {
    }
    close(connection);
  });
  WriteSettings(port);
  EXPECT_EQ(Plugin().GetDomain().status, NO_COMMON_TLS);
  server.join();
  close(listener);
}

}  // namespace
}  // namespace camtest
