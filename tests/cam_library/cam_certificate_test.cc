#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <stdexcept>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "support/expect_throw_what.h"
#include "support/files.h"
#include "support/log_recorder.h"

using namespace quenix::authentication;
using namespace testsupport;

namespace {

constexpr const char* refusal = "The certificate format is invalid; only PEM format is supported.";

std::string OutputOf(const std::string& command) {
  FILE* pipe = popen(command.c_str(), "r");
  std::string output;
  std::array<char, 4096> buffer{};
  while (const std::size_t count = fread(buffer.data(), 1, buffer.size(), pipe)) {
    output.append(buffer.data(), count);
  }
  if (pclose(pipe) != 0) throw std::runtime_error("failed: " + command);
  return output;
}

class CAMCertificateTest : public testing::Test {
 protected:
  CAMCertificateTest() { UseScriptedPlugin(); }

  /// A new certificate, as a PEM text.
  std::string NewCertificate(const std::string& algorithm) {
    OutputOf("openssl req -x509 -nodes -newkey " + algorithm +
             " -subj /CN=cam -days 1 -keyout /dev/null -out " + path_ + " 2>/dev/null");
    return ReadFile(path_);
  }

  /// What the openssl command calls the certificate's SHA-1 fingerprint.
  std::string Fingerprint() {
    const std::string line = OutputOf("openssl x509 -noout -fingerprint -sha1 -in " + path_);
    return line.substr(line.find('=') + 1, 59);
  }

  std::string Imported(const std::string& pem) {
    ActiveDirectoryStore(1).ImportCertificateForCAM(pem);
    return ActiveDirectoryConfigStore().GetThumbprint();
  }

  ScratchFolder folder_;
  std::string path_ = folder_.Path() + "certificate.pem";
};

}  // namespace

TEST_F(CAMCertificateTest, ThumbprintOfAnRsaCertificateIsTheOneThatOpensslPrints) {
  const std::string pem = NewCertificate("rsa:2048");
  EXPECT_EQ(Imported(pem), Fingerprint());
}

TEST_F(CAMCertificateTest, ThumbprintOfAnEcCertificateIsTheOneThatOpensslPrints) {
  const std::string pem = NewCertificate("ec -pkeyopt ec_paramgen_curve:prime256v1");
  EXPECT_EQ(Imported(pem), Fingerprint());
}

TEST_F(CAMCertificateTest, OfAChainTheFirstCertificateCounts) {
  const std::string second = NewCertificate("rsa:2048");
  const std::string first = NewCertificate("rsa:2048");
  EXPECT_EQ(Imported(first + second), Fingerprint());
}

TEST_F(CAMCertificateTest, TextBeforeTheCertificateDoesNotCount) {
  const std::string pem = NewCertificate("rsa:2048");
  EXPECT_EQ(Imported("Subject: the CAM server\n\n" + pem), Fingerprint());
}

TEST_F(CAMCertificateTest, LinesMayEndWithACarriageReturn) {
  std::string pem = NewCertificate("rsa:2048");
  const std::string expected = Fingerprint();
  for (std::size_t end = pem.find('\n'); end != std::string::npos; end = pem.find('\n', end + 2)) {
    pem.insert(end, "\r");
  }
  EXPECT_EQ(Imported(pem), expected);
}

TEST_F(CAMCertificateTest, TheCertificateItselfIsStoredAsItWasGiven) {
  const std::string pem = "leading text\n" + NewCertificate("rsa:2048");
  Imported(pem);
  EXPECT_EQ(ActiveDirectoryConfigStore().GetCertificate(), pem);
}

TEST_F(CAMCertificateTest, DerIsRefused) {
  NewCertificate("rsa:2048");
  const std::string der = OutputOf("openssl x509 -outform DER -in " + path_);
  EXPECT_THROW_WHAT(Imported(der), InvalidCertificateException, refusal);
}

TEST_F(CAMCertificateTest, TruncatedPemIsRefused) {
  const std::string pem = NewCertificate("rsa:2048");
  EXPECT_THROW_WHAT(Imported(pem.substr(0, pem.size() / 2)), InvalidCertificateException, refusal);
}

TEST_F(CAMCertificateTest, GarbageInsideThePemIsRefused) {
  const std::string garbage = "-----BEGIN CERTIFICATE-----\nAAAA\n-----END CERTIFICATE-----\n";
  EXPECT_THROW_WHAT(Imported(garbage), InvalidCertificateException, refusal);
}

TEST_F(CAMCertificateTest, EmptyTextIsRefused) {
  EXPECT_THROW_WHAT(Imported(""), InvalidCertificateException, refusal);
}

TEST_F(CAMCertificateTest, RefusedCertificateLeavesTheStoredOneAlone) {
  const std::string pem = NewCertificate("rsa:2048");
  Imported(pem);
  EXPECT_THROW(Imported("garbage"), InvalidCertificateException);
  EXPECT_EQ(ActiveDirectoryConfigStore().GetCertificate(), pem);
}

TEST_F(CAMCertificateTest, FileIsImportedAsItsText) {
  const std::string pem = NewCertificate("rsa:2048");
  ActiveDirectoryStore(1).ImportCertificateForCAM(path_, "not used");
  EXPECT_EQ(ActiveDirectoryConfigStore().GetCertificate(), pem);
}

TEST_F(CAMCertificateTest, FileThatCannotBeOpenedIsNotFound) {
  EXPECT_THROW_WHAT(ActiveDirectoryStore(1).ImportCertificateForCAM(folder_.Path() + "absent", ""),
                    FileNotFoundException,
                    "Exception 0x00000002: The system cannot find the file specified.");
}

TEST_F(CAMCertificateTest, FolderInsteadOfAFileIsAnIOError) {
  EXPECT_THROW_WHAT(ActiveDirectoryStore(1).ImportCertificateForCAM("/etc", ""), IOError,
                    "Unable to read '/etc': Is a directory");
}

TEST_F(CAMCertificateTest, FailingConfigurationStoreIsLoggedAndItsExceptionGoesOut) {
  const std::string pem = NewCertificate("rsa:2048");
  ActiveDirectoryStore store(1);
  WriteFile("/var/lib/quenix/configstore.db", "no database");
  std::string text;
  try {
    store.ImportCertificateForCAM(pem);
    ADD_FAILURE() << "nothing was thrown";
  } catch (const OrvConfigStore::ConfigStoreException& failure) {
    text = failure.what();
  }
  const LogLine expected{LOG_ERR, "Failed to store thumbprint to Config Store: " + text};
  EXPECT_EQ(RecordedLog(), std::vector<LogLine>{expected});
}
