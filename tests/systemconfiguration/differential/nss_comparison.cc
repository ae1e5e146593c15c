#include "systemconfiguration/differential/nss_comparison.h"

#include <sstream>

#include "systemconfiguration/differential/comparison.h"
#include "systemconfiguration/reference/nss_reference.h"
#include "systemconfiguration/systemconfiguration.h"

namespace differential {
namespace {

using SystemConfiguration::NSSConfiguration;
using SystemConfiguration::NSSDatabase;
using SystemConfiguration::NSSService;

constexpr unsigned databases = 16;

std::string Describe(const std::string& module, const std::list<std::string>& parameters) {
  std::string text = std::to_string(module.size()) + "'" + module + "'";
  for (const std::string& parameter : parameters) {
    text += " " + std::to_string(parameter.size()) + "'" + parameter + "'";
  }
  return text + "\n";
}

std::string Describe(NSSConfiguration configuration) {
  std::string text;
  for (unsigned database = 0; database < databases; ++database) {
    text += std::to_string(database) + ":\n";
    for (const NSSService& service : configuration[static_cast<NSSDatabase::Database>(database)]) {
      text += Describe(service.module(), service.parameters());
    }
  }
  return text;
}

std::string Describe(reference::NssConfiguration configuration) {
  std::string text;
  for (unsigned database = 0; database < databases; ++database) {
    text += std::to_string(database) + ":\n";
    for (const reference::NssService& service : configuration.databases[database]) {
      text += Describe(service.module, service.parameters);
    }
  }
  return text;
}

}  // namespace

std::string CompareConfiguration(const InputCase& input) {
  NSSConfiguration configuration;
  configuration[NSSDatabase::Hosts].emplace_back("old");
  std::string library = ObserveReading(input, [&](std::istream& stream) { stream >> configuration; });
  library += Describe(configuration);
  library += ObserveWriting(input, [&](std::ostream& stream) { stream << configuration; });

  reference::NssConfiguration plain;
  plain.databases[4].push_back({"old", {}});
  std::string expected =
      ObserveReading(input, [&](std::istream& stream) { reference::ReadConfiguration(stream, plain); });
  expected += Describe(plain);
  expected +=
      ObserveWriting(input, [&](std::ostream& stream) { reference::WriteConfiguration(stream, plain); });
  return Difference(library, expected);
}

std::string CompareConfigurationWithItsRoundTrip(const InputCase& input) {
  NSSConfiguration configuration;
  std::istringstream text(input.text);
  Ending([&] { text >> configuration; });
  std::stringstream once;
  once << configuration;
  if (once.str().find_first_of("[]") != std::string::npos) return "";
  NSSConfiguration again;
  once >> again;
  std::ostringstream twice;
  twice << again;
  return Difference(twice.str(), once.str());
}

}  // namespace differential
