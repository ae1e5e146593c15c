#include "cam_trust.h"

#include <arpa/inet.h>

#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>

#include "cam_settings.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "text.h"

namespace velmorctl {

namespace {

Certificate FromFile(const std::string& path) {
  std::ifstream stream(path, std::ios::binary);
  if (!stream || std::filesystem::is_directory(path)) {
    throw Failure(ExitCode::Usage, "'" + path + "' is neither an IPv4 address nor a file that can be read")
        .Try("velmorctl cam trust ADDRESS, or the path of the service's certificate in PEM form");
  }
  return Certificate::FromPem({std::istreambuf_iterator<char>(stream), {}}, path);
}

void RequireFingerprint(const Certificate& certificate, const std::string& expected) {
  if (!IsSameFingerprint(certificate.Sha256(), expected)) {
    throw Failure(ExitCode::Proxy, "the certificate does not have the expected SHA-256")
        .Detail("expected", expected)
        .Detail("found", certificate.Sha256())
        .Try("ask the service's administrator for the fingerprint; somebody may stand between");
  }
}

/// Whoever cannot compare fingerprints must not trust what the network shows.
void Confirm() {
  std::fstream terminal("/dev/tty");
  if (!terminal) {
    throw Failure(ExitCode::Usage, "there is no terminal to ask for a confirmation at")
        .Try("give the fingerprint with --sha256, or trust without asking with --yes");
  }
  terminal << "Does the service's administrator see the same fingerprints? Trust this certificate? [yes/no] "
           << std::flush;
  std::string answer;
  std::getline(terminal, answer);
  if (Trimmed(answer) != "yes") {
    throw Failure(ExitCode::Proxy, "the certificate was not confirmed").Try("answer yes");
  }
}

/// The pin first: a host that has only one of the two new refuses the service, which is the safe side.
void Import(const Certificate& certificate) {
  Directory directory{std::chrono::seconds(defaultTimeoutSeconds)};
  const CamSettingsBackup backup;
  ReplacePins(certificate.Sha256());
  try {
    directory.Store()->ImportCertificateForCAM(certificate.Pem());
  } catch (...) {
    backup.Restore();
    throw;
  }
}

}  // namespace

bool IsAddress(const std::string& text) {
  in_addr address{};
  return inet_pton(AF_INET, text.c_str(), &address) == 1;
}

std::vector<std::vector<std::string>> Rows(const Certificate& certificate) {
  return {{"Certificate", certificate.Subject()},
          {"Valid from", certificate.ValidFrom()},
          {"Valid until", certificate.ValidUntil() + (certificate.IsPastItsDate() ? "  (past)" : "")},
          {"SHA-256", certificate.Sha256()},
          {"SHA-1", certificate.Sha1()}};
}

Json AsJson(const Certificate& certificate) {
  return {{"subject", certificate.Subject()},       {"validFrom", certificate.ValidFrom()},
          {"validUntil", certificate.ValidUntil()}, {"pastItsDate", certificate.IsPastItsDate()},
          {"sha256", certificate.Sha256()},         {"sha1", certificate.Sha1()}};
}

ExitCode TrustCertificate(const TrustOptions& options, Situation& situation) {
  RequireRoot("import a certificate");
  situation.doing = "import the certificate";
  situation.platformFailure = ExitCode::Configuration;
  situation.Watch(camSettingsFile);
  const bool fromServer = IsAddress(options.source);
  const Certificate certificate =
      fromServer ? Certificate::OfServer(options.source, ReadCamSettings().port) : FromFile(options.source);
  PrintTable(Rows(certificate));
  std::cout.flush();
  if (!options.sha256.empty()) {
    RequireFingerprint(certificate, options.sha256);
  } else if (fromServer && !options.yes) {
    Confirm();
  }
  Import(certificate);
  std::cout << "The certificate is trusted: joins through the CAM proxy expect it.\n";
  if (certificate.IsPastItsDate()) {
    std::cerr << "velmorctl: warning: the certificate is past its date; it is accepted all the same\n";
  }
  return ExitCode::Fine;
}

}  // namespace velmorctl
