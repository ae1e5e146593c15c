/// velmorctl cam: the service that creates the host's computer account.
#include <CLI/App.hpp>
#include <iostream>
#include <optional>

#include "authentication/active_directory_config_store.h"
#include "authentication/library_exceptions.h"
#include "cam_settings.h"
#include "cam_trust.h"
#include "command.h"
#include "directory.h"
#include "failure.h"
#include "hostmgmt/advanced_options.h"
#include "hostmgmt/host.h"
#include "orvconfigstore/config_store.h"
#include "output.h"
#include "text.h"

namespace velmorctl {

namespace {

using OrvConfigStore::ConfigStore;
using quenix::authentication::ActiveDirectoryConfigStore;
using quenix::authentication::ConfigurationError;

struct Options {
  bool json = false;
  std::string server;
};

/// A field of a record of the configuration store, or nothing when there is no such record.
std::optional<std::string> Recorded(std::string (ActiveDirectoryConfigStore::*get)()) {
  ActiveDirectoryConfigStore store;
  try {
    return (store.*get)();
  } catch (const ConfigurationError&) {
    return std::nullopt;
  }
}

std::optional<Certificate> ImportedCertificate() {
  const auto text = Recorded(&ActiveDirectoryConfigStore::GetCertificate);
  if (!text) {
    return std::nullopt;
  }
  return Certificate::FromPem(*text, "the host's configuration store");
}

/// Whether joins verify the certificate; nothing when the option is missing or impossible.
std::optional<bool> Verification() {
  const auto root = HostMgmt::HostFactory::GetHost()->GetAdvancedOptions();
  const auto branch = root ? root->GetChild("UserVars") : nullptr;
  const auto option = branch ? branch->GetOption("ActiveDirectoryVerifyCAMCertificate") : nullptr;
  const auto* integer = dynamic_cast<const HostMgmt::Adv::AdvancedIntegerOption*>(option.get());
  if (integer == nullptr || (integer->GetValue() != 0 && integer->GetValue() != 1)) {
    return std::nullopt;
  }
  return integer->GetValue() == 1;
}

std::string Describe(const std::optional<bool>& verification) {
  return !verification ? "impossible value" : *verification ? "on" : "off";
}

Json AsJson(const std::optional<bool>& verification) {
  return verification ? Json(*verification) : Json(nullptr);
}

void RequireAddress(const std::string& server) {
  if (!IsAddress(server)) {
    throw Failure(ExitCode::Usage, "'" + server + "' is not an IPv4 address")
        .Try("give the service's IPv4 address; host names are not taken");
  }
}

/// The domain that the service serves, asked through the library and the plug-in.
std::string DomainOf(const std::string& server, Situation& situation) {
  situation.doing = "ask the CAM service at " + server + " for its domain";
  situation.throughProxy = true;
  Directory directory{std::chrono::seconds(defaultTimeoutSeconds)};
  return directory.Store()->GetDomainForCAMService(server);
}

ExitCode Discover(const Options& options, Situation& situation) {
  RequireAddress(options.server);
  const std::string domain = DomainOf(options.server, situation);
  if (options.json) {
    PrintJson({{"schema", "velmor.cam-discover/1"},
               {"server", options.server},
               {"domain", domain},
               {"verified", false}});
  } else {
    std::cout << "The CAM service at " << options.server << " says that it serves " << Printable(domain)
              << ". Its certificate was not verified.\n";
  }
  return ExitCode::Fine;
}

ExitCode Show(const Options& options, Situation& situation) {
  situation.doing = "show what is known of the CAM proxy";
  const auto certificate = ImportedCertificate();
  const CamSettings settings = ReadCamSettings();
  const auto verification = Verification();
  const std::string joinedThrough = Recorded(&ActiveDirectoryConfigStore::GetAuthProxyAddr).value_or("");
  if (options.json) {
    PrintJson({{"schema", "velmor.cam-show/1"},
               {"verification", AsJson(verification)},
               {"certificate", certificate ? AsJson(*certificate) : Json(nullptr)},
               {"pins", settings.pins},
               {"port", settings.port},
               {"token", settings.hasToken},
               {"joinedThrough", joinedThrough}});
    return ExitCode::Fine;
  }
  std::vector<std::vector<std::string>> rows = {
      {"Verification", Describe(verification)},
      {"Port", std::to_string(settings.port)},
      {"Token", settings.hasToken ? "set" : "none"},
      {"Joined through", joinedThrough.empty() ? "no proxy" : joinedThrough}};
  const auto details = certificate ? Rows(*certificate)
                                   : std::vector<std::vector<std::string>>{{"Certificate", "none imported"}};
  rows.insert(rows.end(), details.begin(), details.end());
  for (const auto& [key, value] : settings.pins) {
    rows.push_back({"Pinned " + key, value});
  }
  PrintTable(rows);
  return ExitCode::Fine;
}

ExitCode Forget(const Options&, Situation& situation) {
  RequireRoot("forget the certificate");
  situation.doing = "forget the certificate";
  situation.platformFailure = ExitCode::Configuration;
  situation.Watch(camSettingsFile);
  ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace)
      ->RemoveObject(ActiveDirectoryConfigStore::AUTH_PROXY_CERT_CSO_ID);
  situation.AddChange("the imported certificate was removed");
  ReplacePins("");
  std::cout << "No certificate is trusted any more.\n";
  return ExitCode::Fine;
}

/// How the certificate that a server shows stands to the imported one.
struct Comparison {
  bool matches;
  std::string text;
};

Comparison Compare(const Certificate& shown, const std::string& server) {
  const auto imported = Recorded(&ActiveDirectoryConfigStore::GetThumbprint);
  const std::string pin = ReadCamSettings().PinFor(server);
  if (!imported) {
    return {false, "none was imported"};
  }
  if (*imported != shown.Sha1()) {
    return {false, "not the imported one (SHA-1 " + *imported + ")"};
  }
  if (pin.empty()) {
    return {true, "the imported one, compared by its SHA-1 only"};
  }
  return IsSameFingerprint(pin, shown.Sha256())
             ? Comparison{true, "the imported one"}
             : Comparison{false, "not the pinned one (SHA-256 " + pin + ")"};
}

ExitCode Test(const Options& options, Situation& situation) {
  RequireAddress(options.server);
  const auto verification = Verification();
  const Certificate shown = Certificate::OfServer(options.server, ReadCamSettings().port);
  const Comparison comparison = Compare(shown, options.server);
  const bool accepted = verification && (!*verification || comparison.matches);
  // A server that a join would refuse is asked nothing.
  const std::string domain = accepted ? DomainOf(options.server, situation) : "";
  if (options.json) {
    PrintJson({{"schema", "velmor.cam-test/1"},
               {"server", options.server},
               {"verification", AsJson(verification)},
               {"certificate", AsJson(shown)},
               {"certificateMatches", comparison.matches},
               {"accepted", accepted},
               {"domain", domain}});
  } else {
    std::vector<std::vector<std::string>> rows = {{"Server", options.server},
                                                  {"Verification", Describe(verification)}};
    const auto details = Rows(shown);
    rows.insert(rows.end(), details.begin(), details.end());
    rows.push_back({"Compared", comparison.text});
    rows.push_back({"Accepted", accepted ? "yes" : "no"});
    if (accepted) rows.push_back({"Domain", domain});
    PrintTable(rows);
  }
  return accepted ? ExitCode::Fine : ExitCode::Proxy;
}

void AddTrust(CLI::App& cam, Invocation& invocation) {
  auto options = std::make_shared<TrustOptions>();
  CLI::App* trust = cam.add_subcommand("trust", "Import the service's certificate");
  trust
      ->add_option("ADDRESS|FILE", options->source,
                   "Fetch it from the service at this IPv4 address, or read it from a PEM file")
      ->required();
  trust->add_option("--sha256", options->sha256, "Trust it only if it has this fingerprint, and do not ask");
  trust->add_flag("--yes", options->yes, "Trust what the service shows, and do not ask");
  Bind(*trust, invocation, options, TrustCertificate);
}

}  // namespace

void AddCamCommand(CLI::App& root, Invocation& invocation) {
  auto options = std::make_shared<Options>();
  CLI::App* cam = root.add_subcommand("cam", "The service that creates the host's computer account");
  cam->require_subcommand(1);
  CLI::App* discover = cam->add_subcommand("discover", "Ask the service which domain it serves");
  AddTrust(*cam, invocation);
  CLI::App* show = cam->add_subcommand("show", "Show the trusted certificate and the settings");
  CLI::App* forget = cam->add_subcommand("forget", "Trust no certificate any more");
  CLI::App* test = cam->add_subcommand("test", "Check whether a join through the service would accept it");
  for (CLI::App* command : {discover, test}) {
    command->add_option("ADDRESS", options->server, "The service's IPv4 address")->required();
  }
  for (CLI::App* command : {discover, show, test}) {
    AddJsonFlag(*command, options->json);
  }
  Bind(*discover, invocation, options, Discover);
  Bind(*show, invocation, options, Show);
  Bind(*forget, invocation, options, Forget);
  Bind(*test, invocation, options, Test);
}

}  // namespace velmorctl
