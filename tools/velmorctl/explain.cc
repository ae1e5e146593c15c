#include "explain.h"

#include <optional>
#include <system_error>

#include "authentication/exception.h"
#include "authentication/library_exceptions.h"
#include "hostmgmt/host_management_exception.h"
#include "meanings.h"
#include "plugin_file.h"
#include "proxy_meanings.h"
#include "settings_file.h"
#include "text.h"

namespace velmorctl {

namespace {

using quenix::authentication::Exception;

/// What stands in the way of loading the configured provider.
std::optional<FileProblem> ProviderProblem() {
  SettingsInspection settings = InspectProviderFile();
  if (settings.problem) {
    return settings.problem;
  }
  return InspectProvider(settings.value).problem;
}

Failure WithoutOperation(Failure failure) {
  PluginDescription plugin = InspectProvider(InspectProviderFile().value);
  return failure.Detail("provider", plugin.name)
      .Detail("file", plugin.file)
      .Detail("reason",
              "the plug-in does not have this operation; it lacks: " + Join(MissingOperations(plugin), ", "));
}

/// Looks at the files that the failure may come from.
std::optional<FileProblem> ProblemBehind(const Meaning& meaning) {
  if (meaning.code == ExitCode::ProviderUnusable) {
    return ProviderProblem();
  }
  if (meaning.code != ExitCode::Configuration) {
    return std::nullopt;
  }
  // A malformed provider.conf is the one fault of that file that the library does not report as a provider's.
  std::optional<FileProblem> problem = InspectProviderFile().problem;
  return problem && problem->kind == FileProblem::Kind::Malformed ? problem
                                                                  : InspectAuthenticationFile().problem;
}

Failure ExplainException(const Exception& exception, const Situation& situation,
                         const std::string& happened) {
  const bool byProxy = situation.throughProxy && situation.providerReason.empty();
  const Meaning& meaning = byProxy ? ProxyMeaningOf(exception) : MeaningOf(exception);
  if (meaning.missingOperation) {
    return WithoutOperation(Failure(meaning.code, happened).Try(meaning.advice));
  }
  if (std::optional<FileProblem> problem = ProblemBehind(meaning)) {
    return AsFailure(*problem, meaning.code, happened);
  }
  Failure failure(meaning.code, happened);
  if (exception.Code() != 0) {
    failure.Detail("status", std::to_string(exception.Code()));
  }
  if (!situation.providerReason.empty()) {
    failure.Detail("provider", Printable(situation.providerReason));
  }
  return failure.Try(meaning.advice);
}

}  // namespace

Failure Explain(const std::exception& exception, const Situation& situation) {
  if (const auto* failure = dynamic_cast<const Failure*>(&exception)) {
    return *failure;
  }
  std::string happened =
      (situation.doing.empty() ? "" : "cannot " + situation.doing + ": ") + exception.what();
  if (const auto* libraryException = dynamic_cast<const Exception*>(&exception)) {
    return ExplainException(*libraryException, situation, happened);
  }
  if (dynamic_cast<const HostMgmt::Lib::HostMgmtException*>(&exception) != nullptr) {
    const Meaning& meaning = MeaningOf(exception);
    return Failure(meaning.code == ExitCode::Configuration ? meaning.code : situation.platformFailure,
                   happened)
        .Try(meaning.advice);
  }
  return Failure(ExitCode::Other, happened).Try("look into the system log");
}

std::string FailureReport(const Failure& failure, const Situation& situation) {
  std::string report = "velmorctl: " + Printable(failure.what()) + "\n";
  auto addLine = [&report](const std::string& name, const std::string& value) {
    report += "  " + name + ":" + std::string(name.size() < 9 ? 9 - name.size() : 1, ' ') + value + "\n";
  };
  for (const Failure::NamedDetail& detail : failure.Details()) {
    addLine(detail.name, detail.value);
  }
  std::vector<std::string> changes = situation.Changes();
  addLine("changed", changes.empty() ? "nothing" : Join(changes, "; "));
  if (!failure.Advice().empty()) {
    addLine("try", failure.Advice());
  }
  return report;
}

}  // namespace velmorctl
