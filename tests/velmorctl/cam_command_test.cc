// The command, the real CAM proxy plug-in and a service on the loopback interface; the provider follows a
// script.
#include <gtest/gtest.h>
#include <openssl/pem.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cctype>
#include <chrono>
#include <csignal>
#include <thread>

#include "cam/plugin.h"
#include "cam/tls_server.h"
#include "prepared_host.h"
#include "process_memory.h"
#include "terminal_session.h"

namespace velmorctltest {

namespace {

using camtest::Answering;
using camtest::Connection;
using camtest::HttpAnswer;
using camtest::Identity;
using camtest::LOOPBACK;
using camtest::TlsServer;
using testsupport::ReadFile;
using testsupport::WriteFile;

const std::string OPTION = "UserVars.ActiveDirectoryVerifyCAMCertificate";
std::string JoinCallWith(std::size_t blobSize) {
  return "joinDomainWithMachineAccount corp.example CORP sandbox HOST2$ (" + std::to_string(blobSize) +
         " characters)";
}

const std::string JOIN_CALL = JoinCallWith(8);

/// A service that knows the domain, and answers creations with `answer`.
camtest::Conversation ServiceWithCreation(const std::string& answer) {
  return [answer](Connection& connection) {
    const bool question = connection.ReadRequest().starts_with("GET");
    connection.Send(question ? HttpAnswer("200 OK", camtest::DOMAIN_BODY) : answer);
  };
}

const std::string CREATED = HttpAnswer("201 Created", camtest::ACCOUNT_BODY);

class CamCommandTest : public PreparedHost {
 protected:
  CamCommandTest() {
    testsupport::CopyFile(VELMORCTL_CAM_PLUGIN, testsupport::PLUGIN_FOLDER + "libcam.so");
    WriteFile(testsupport::CAMPROVIDER_CONF, "provider = \"cam\"\n");
    WriteFile("/etc/hosts", "127.0.0.1 localhost\n127.0.1.1 sandbox.corp.example sandbox\n");
    camtest::WriteSettings(server_.Port());
  }

  static Outcome Trust(const std::string& source = LOOPBACK) {
    return Velmorctl({"cam", "trust", source, "--yes"});
  }

  static Outcome JoinThroughProxy() {
    return Velmorctl({"join", "--proxy", LOOPBACK, "--skip-hostname-check"});
  }

  static nlohmann::json Shown() { return Velmorctl({"cam", "show", "--json"}).Json(); }

  std::string PemFile() const {
    const std::unique_ptr<BIO, int (*)(BIO*)> bio(BIO_new_file("/run/cam.pem", "w"), BIO_free);
    PEM_write_bio_X509(bio.get(), identity_.Certificate());
    return "/run/cam.pem";
  }

  const Identity identity_;
  TlsServer server_{identity_, ServiceWithCreation(CREATED)};
};

TEST_F(CamCommandTest, DiscoverNamesTheDomainAndSaysThatNothingWasVerified) {
  const Outcome outcome = Velmorctl({"cam", "discover", LOOPBACK});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(
      outcome.output,
      "The CAM service at 127.0.0.1 says that it serves corp.example. Its certificate was not verified.\n");
}

TEST_F(CamCommandTest, DiscoverGivesTheDomainAsJson) {
  EXPECT_EQ(Velmorctl({"cam", "discover", LOOPBACK, "--json"}).Json(),
            (nlohmann::json{{"schema", "velmor.cam-discover/1"},
                            {"server", LOOPBACK},
                            {"domain", "corp.example"},
                            {"verified", false}}));
}

TEST_F(CamCommandTest, HostNameIsNoAddress) {
  EXPECT_EQ(Velmorctl({"cam", "discover", "localhost"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"cam", "test", "localhost"}).exitCode, 2);
}

TEST_F(CamCommandTest, TrustStoresThumbprintAndSha256) {
  EXPECT_EQ(Trust().exitCode, 0);
  const nlohmann::json shown = Shown();
  EXPECT_EQ(shown["certificate"]["sha1"], identity_.Sha1());
  EXPECT_EQ(shown["pins"], (nlohmann::json{{"sha256", identity_.Sha256()}}));
}

TEST_F(CamCommandTest, TrustShowsBothFingerprints) {
  const std::string output = Trust().output;
  EXPECT_NE(output.find("SHA-256      " + identity_.Sha256() + "\n"), std::string::npos) << output;
  EXPECT_NE(output.find("SHA-1        " + identity_.Sha1() + "\n"), std::string::npos) << output;
}

TEST_F(CamCommandTest, TrustSendsNoRequest) {
  Trust();
  EXPECT_TRUE(server_.RequestsOf(1).empty());
}

TEST_F(CamCommandTest, TrustTakesAFileWithoutAsking) {
  EXPECT_EQ(Velmorctl({"cam", "trust", PemFile()}).exitCode, 0);
  EXPECT_EQ(Shown()["certificate"]["sha256"], identity_.Sha256());
}

TEST_F(CamCommandTest, TrustRefusesAFileWithoutACertificate) {
  WriteFile("/run/no.pem", "no certificate\n");
  const Outcome outcome = Velmorctl({"cam", "trust", "/run/no.pem"});
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("'/run/no.pem' holds no certificate in PEM form"), std::string::npos)
      << outcome.errors;
}

TEST_F(CamCommandTest, TrustAsksForNoPassPhrase) {
  WriteFile("/run/encrypted.pem",
            "-----BEGIN CERTIFICATE-----\nProc-Type: 4,ENCRYPTED\n"
            "DEK-Info: AES-128-CBC,000102030405060708090A0B0C0D0E0F\n\nMDAwMDAwMDAwMDAwMDAwMA==\n"
            "-----END CERTIFICATE-----\n");
  TerminalSession session({"cam", "trust", "/run/encrypted.pem"});
  session.Type("phrase\n");
  const Outcome outcome = session.Wait();
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_EQ(outcome.output.find("pass phrase"), std::string::npos) << outcome.output;
}

TEST_F(CamCommandTest, TrustNeedsRoot) {
  EXPECT_EQ(Velmorctl({"cam", "trust", LOOPBACK, "--yes"}, WithoutRoot()).exitCode, 77);
}

TEST_F(CamCommandTest, TrustTakesTheRightFingerprintInAnyForm) {
  std::string digest = identity_.Sha256();
  std::erase(digest, ':');
  for (char& digit : digest) {
    digit = static_cast<char>(std::tolower(static_cast<unsigned char>(digit)));
  }
  EXPECT_EQ(Velmorctl({"cam", "trust", LOOPBACK, "--sha256", digest}).exitCode, 0);
  EXPECT_FALSE(Shown()["certificate"].is_null());
}

TEST_F(CamCommandTest, TrustRefusesAnotherFingerprintAndStoresNothing) {
  const std::string before = ReadFile(camtest::SETTINGS);
  const Outcome outcome = Velmorctl({"cam", "trust", LOOPBACK, "--sha256", Identity().Sha256()});
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_TRUE(Shown()["certificate"].is_null());
  EXPECT_EQ(ReadFile(camtest::SETTINGS), before);
}

TEST_F(CamCommandTest, TrustAsksAtTheTerminal) {
  TerminalSession session({"cam", "trust", LOOPBACK});
  ASSERT_TRUE(session.AwaitText("Trust this certificate? [yes/no] "));
  session.Type("yes\n");
  EXPECT_EQ(session.Wait().exitCode, 0);
  EXPECT_FALSE(Shown()["certificate"].is_null());
}

TEST_F(CamCommandTest, TrustThatIsNotConfirmedStoresNothing) {
  TerminalSession session({"cam", "trust", LOOPBACK});
  ASSERT_TRUE(session.AwaitText("Trust this certificate? [yes/no] "));
  session.Type("y\n");
  EXPECT_EQ(session.Wait().exitCode, 12);
  EXPECT_TRUE(Shown()["certificate"].is_null());
}

TEST_F(CamCommandTest, TrustLeavesNoTokenInMemory) {
  camtest::WriteSettings(server_.Port(), "token = \"Zm9yIG9uZSBjcmVhdGlvbiBhbmQgbm8gb3RoZXI\"\n");
  TerminalSession session({"cam", "trust", LOOPBACK});
  ASSERT_TRUE(session.AwaitText("Trust this certificate? [yes/no] "));
  EXPECT_FALSE(MemoryHolds(session.Process(), "BhbmQgbm8gb3RoZXI"));
  session.Type("no\n");
  session.Wait();
}

TEST_F(CamCommandTest, TrustKeepsTheOtherSettingsAndTheMode) {
  camtest::WriteSettings(server_.Port(), "token = \"Zm9yIG9uZSBjcmVhdGlvbg\"\nsha256-127.0.0.1 = AB\n");
  EXPECT_EQ(Trust().exitCode, 0);
  EXPECT_EQ(ReadFile(camtest::SETTINGS), "port = \"" + std::to_string(server_.Port()) +
                                             "\"\ntoken = \"Zm9yIG9uZSBjcmVhdGlvbg\"\nsha256 = \"" +
                                             identity_.Sha256() + "\"\n");
  EXPECT_EQ(testsupport::ModeOf(camtest::SETTINGS), 0600U);
}

TEST_F(CamCommandTest, TrustPutsThePinBackWhenTheCertificateCannotBeStored) {
  testsupport::MakeFolders("/var/lib/quenix/configstore.db");
  const std::string before = ReadFile(camtest::SETTINGS);
  EXPECT_EQ(Trust().exitCode, 11);
  EXPECT_EQ(ReadFile(camtest::SETTINGS), before);
}

TEST_F(CamCommandTest, TrustOfAServerThatDoesNotAnswerGivesTheReason) {
  const Outcome outcome = Trust("127.0.0.9");
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("  reason:   Connection refused\n"), std::string::npos) << outcome.errors;
}

TEST_F(CamCommandTest, TrustOfAServerThatTricklesEndsInTime) {
  std::uint16_t port = 0;
  const int listener = camtest::ListenOnly(&port, 1);
  std::thread server([listener] {
    const int connection = accept4(listener, nullptr, nullptr, SOCK_CLOEXEC);
    // The beginning of a long piece of a handshake, and then a byte of it now and then.
    const std::string head("\x16\x03\x03\x40\x00\x02\x00\x3f\xfc", 9);
    bool isThere = send(connection, head.data(), head.size(), MSG_NOSIGNAL) > 0;
    for (int count = 0; isThere && count < 300; ++count) {
      isThere = send(connection, "x", 1, MSG_NOSIGNAL) > 0;
      std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
    close(connection);
  });
  camtest::WriteSettings(port);
  const Outcome outcome = Trust();
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("  reason:   no answer within 10 seconds\n"), std::string::npos)
      << outcome.errors;
  server.join();
  close(listener);
}

TEST_F(CamCommandTest, ShowNeverPrintsTheToken) {
  camtest::WriteSettings(server_.Port(), "token = \"Zm9yIG9uZSBjcmVhdGlvbg\"\n");
  EXPECT_EQ(Shown()["token"], true);
  EXPECT_EQ(Velmorctl({"cam", "show"}).output.find("Zm9y"), std::string::npos);
}

TEST_F(CamCommandTest, FaultOfTheSettingsIsShownWithItsLine) {
  WriteFile(camtest::SETTINGS, "port = \"8443\"\nwhat\n");
  const Outcome outcome = Velmorctl({"cam", "show"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("  line:     2\n"), std::string::npos) << outcome.errors;
}

TEST_F(CamCommandTest, ForgetRemovesCertificateAndPins) {
  Trust();
  EXPECT_EQ(Velmorctl({"cam", "forget"}).exitCode, 0);
  EXPECT_TRUE(Shown()["certificate"].is_null());
  EXPECT_TRUE(Shown()["pins"].empty());
}

TEST_F(CamCommandTest, TestAcceptsTheImportedCertificate) {
  Trust();
  const Outcome outcome = Velmorctl({"cam", "test", LOOPBACK, "--json"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.Json()["certificateMatches"], true);
  EXPECT_EQ(outcome.Json()["domain"], "corp.example");
}

TEST_F(CamCommandTest, TestAsksAServerWithAnotherCertificateNothing) {
  Trust();
  TlsServer other(Identity(), ServiceWithCreation(CREATED));
  camtest::WriteSettings(other.Port());
  const Outcome outcome = Velmorctl({"cam", "test", LOOPBACK, "--json"});
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_EQ(outcome.Json()["accepted"], false);
  EXPECT_TRUE(other.RequestsOf(1).empty());
}

TEST_F(CamCommandTest, TestAcceptsAnyCertificateWithVerificationOff) {
  Velmorctl({"option", "set", OPTION, "0"});
  const Outcome outcome = Velmorctl({"cam", "test", LOOPBACK, "--json"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.Json()["certificateMatches"], false);
}

TEST_F(CamCommandTest, JoinHandsTheAccountToTheProvider) {
  Trust();
  const Outcome outcome = JoinThroughProxy();
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.output,
            "The host is joined to corp.example, and the store \"Active Directory\" is active.\n");
  EXPECT_TRUE(Called(JOIN_CALL));
  EXPECT_EQ(ActiveStore(), "Active Directory");
  EXPECT_EQ(Shown()["joinedThrough"], LOOPBACK);
}

TEST_F(CamCommandTest, TextForTheJoinIsWipedFromMemoryAfterTheJoin) {
  std::string blob;
  while (blob.size() < 400) {
    blob += "QmxvYg" + std::to_string(blob.size());
  }
  TlsServer other(
      identity_, ServiceWithCreation(
                     HttpAnswer("201 Created", R"({"accountName": "HOST2$", "joinBlob": ")" + blob + "\"}")));
  camtest::WriteSettings(other.Port());
  Trust();
  Script("hang.joinDomainWithMachineAccount", "");
  Script("hang.getDomainTrustState", "");
  RunningProgram join({"join", "--proxy", LOOPBACK, "--skip-hostname-check"});
  ASSERT_TRUE(Eventually([&blob] { return Called(JoinCallWith(blob.size())); }));
  ASSERT_TRUE(MemoryHolds(join.Process(), blob.substr(200, 100)));
  RemoveScript("hang.joinDomainWithMachineAccount");
  ASSERT_TRUE(Eventually([] { return Called("getDomainTrustState"); }));
  EXPECT_FALSE(MemoryHolds(join.Process(), blob.substr(200, 100)));
}

TEST_F(CamCommandTest, JoinAsksForThatContainer) {
  Trust();
  Velmorctl({"join", "--proxy", LOOPBACK, "--container", "OU=Hosts", "--skip-hostname-check"});
  bool asked = false;
  for (const std::string& request : server_.RequestsOf(5)) {
    asked = asked || request.find(R"("container":"OU=Hosts")") != std::string::npos;
  }
  EXPECT_TRUE(asked);
}

TEST_F(CamCommandTest, JoinTakesEitherADomainOrAProxy) {
  EXPECT_EQ(Velmorctl({"join"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"join", "corp.example", "--proxy", LOOPBACK}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"join", "corp.example", "--container", "OU=Hosts"}).exitCode, 2);
}

TEST_F(CamCommandTest, JoinWithoutAnImportedCertificateSaysWhatToDo) {
  const Outcome outcome = JoinThroughProxy();
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("  changed:  nothing\n  try:      velmorctl cam trust ADDRESS\n"),
            std::string::npos)
      << outcome.errors;
}

TEST_F(CamCommandTest, JoinWithoutAPlugInSaysWhatToDo) {
  testsupport::RemoveFile(testsupport::CAMPROVIDER_CONF);
  Trust();
  const Outcome outcome = JoinThroughProxy();
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("provider = \"cam\""), std::string::npos) << outcome.errors;
}

TEST_F(CamCommandTest, JoinAtAServerWithAnotherCertificateIsRefused) {
  Trust();
  TlsServer other(Identity(), ServiceWithCreation(CREATED));
  camtest::WriteSettings(other.Port());
  EXPECT_EQ(JoinThroughProxy().exitCode, 12);
  EXPECT_FALSE(Called(JOIN_CALL));
}

TEST_F(CamCommandTest, JoinAtAServerWithAnotherCertificateSaysWhatToDo) {
  Trust();
  TlsServer other(Identity(), ServiceWithCreation(CREATED));
  camtest::WriteSettings(other.Port());
  const Outcome outcome = JoinThroughProxy();
  EXPECT_NE(
      outcome.errors.find("  try:      compare the service's fingerprints with \"velmorctl cam show\"; then "
                          "\"velmorctl cam trust ADDRESS\"\n"),
      std::string::npos)
      << outcome.errors;
}

TEST_F(CamCommandTest, NameThatIsBusyMayBeThatOfAnAccountThatIsBeingRemoved) {
  Trust();
  TlsServer busy(identity_, ServiceWithCreation(HttpAnswer("409 Conflict", R"({"status": 1061})")));
  camtest::WriteSettings(busy.Port());
  EXPECT_NE(JoinThroughProxy().errors.find(
                "  try:      an account of this name is being created or removed: try again in a minute\n"),
            std::string::npos);
}

TEST_F(CamCommandTest, FailureOfTheProviderIsTheProvidersAffair) {
  Trust();
  Script("status.joinDomainWithMachineAccount", "1064");
  EXPECT_EQ(JoinThroughProxy().exitCode, 7);
}

TEST_F(CamCommandTest, InterruptedJoinIsUndoneWithoutAnAccount) {
  Trust();
  Script("hang.joinDomainWithMachineAccount", "");
  RunningProgram join({"join", "--proxy", LOOPBACK, "--skip-hostname-check"});
  ASSERT_TRUE(Eventually([] { return Called(JOIN_CALL); }));
  join.Signal(SIGINT);
  ASSERT_TRUE(Eventually([&join] { return join.ErrorsSoFar().find("interrupted") != std::string::npos; }));
  RemoveScript("hang.joinDomainWithMachineAccount");
  const Outcome outcome = join.Wait();
  EXPECT_EQ(outcome.signalNumber, SIGINT);
  EXPECT_TRUE(Called("partDomain -"));
  EXPECT_NE(outcome.errors.find("changed:  the computer account, which stays in the directory\n"),
            std::string::npos)
      << outcome.errors;
  EXPECT_EQ(Shown()["joinedThrough"], "");
}

class CamStatusTest : public CamCommandTest, public ::testing::WithParamInterface<unsigned> {};

TEST_P(CamStatusTest, OfTheServiceEndsWithTheCodeOfTheProxy) {
  Trust();
  const std::string status = std::to_string(GetParam());
  TlsServer refusing(identity_,
                     ServiceWithCreation(HttpAnswer("403 Forbidden", R"({"status": )" + status + "}")));
  camtest::WriteSettings(refusing.Port());
  const Outcome outcome = JoinThroughProxy();
  EXPECT_EQ(outcome.exitCode, 12);
  EXPECT_NE(outcome.errors.find("  status:   " + status + "\n  changed:  nothing\n  try:      "),
            std::string::npos)
      << outcome.errors;
}

INSTANTIATE_TEST_SUITE_P(Each, CamStatusTest,
                         ::testing::Values(5U, 13U, 31U, 50U, 59U, 87U, 170U, 267U, 1061U, 1067U, 1069U,
                                           1210U, 1311U, 1326U, 1359U, 1398U, 1460U, 1816U, 2224U, 2691U,
                                           10054U),
                         ::testing::PrintToStringParamName());

}  // namespace

}  // namespace velmorctltest
