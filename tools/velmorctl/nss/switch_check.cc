#include "nss/switch_check.h"

#include <algorithm>
#include <string_view>
#include <utility>

#include "nss/databases.h"
#include "nss/line_faults.h"

namespace velmorctl {

namespace {

/// What Debian's own file names without bringing the module; the C library passes over it.
constexpr std::pair<std::string_view, std::string_view> missingByDefault[] = {
    {"protocols", "db"}, {"services", "db"}, {"ethers", "db"}, {"rpc", "db"}, {"netgroup", "nis"}};

bool IsMissingByDefault(const std::string& database, const std::string& service) {
  return std::any_of(std::begin(missingByDefault), std::end(missingByDefault),
                     [&](const auto& pair) { return pair.first == database && pair.second == service; });
}

class Check {
 public:
  Check(const SwitchFile& file, const std::string& shown, const ServiceModules& modules)
      : file_(file), shown_(shown), modules_(modules) {}

  std::vector<FileProblem> Run() {
    for (const SwitchLine& line : file_.Lines()) {
      CheckLine(line);
    }
    return std::move(problems_);
  }

 private:
  void Add(const SwitchLine& line, const std::string& value, const std::string& reason,
           const std::string& remedy) {
    problems_.push_back(LineProblem(shown_, line, value, reason, remedy));
  }

  void CheckLine(const SwitchLine& line) {
    for (const LineFault& fault : line.faults) {
      problems_.push_back(FaultProblem(fault, line, shown_));
    }
    if (!IsLibraryDatabase(line.database)) {
      CheckOtherDatabase(line);
    } else if (file_.Counts(line)) {
      CheckServices(line);
    } else if (!line.Has(LineFault::Kind::NoNewline)) {
      Add(line, line.database, "a later line of the same database takes the place of this one",
          "leave one line for the database");
    }
  }

  void CheckOtherDatabase(const SwitchLine& line) {
    if (!line.database.empty() && !IsKnownDatabase(line.database)) {
      Add(line, line.database, "no program is known that reads a database of this name",
          "correct the name, or remove the line");
    }
  }

  void CheckServices(const SwitchLine& line) {
    if (line.services.empty()) {
      Add(line, line.database,
          "the database has no services; programs that look something up in it may crash",
          "write services behind the colon, for example files, or remove the line");
      return;
    }
    CheckDuplicates(line);
    CheckModules(line);
    if (HoldsLocalAccounts(line.database)) {
      CheckLocalFirst(line);
    }
    CheckReach(line);
  }

  void CheckDuplicates(const SwitchLine& line) {
    for (const SwitchService& service : line.services) {
      if (line.Find(service.meaning.name) != &service) {
        Add(line, service.meaning.name, "the service stands twice in the line", "remove one of the two");
      }
    }
  }

  void CheckModules(const SwitchLine& line) {
    for (const SwitchService& service : line.services) {
      const std::string& name = service.meaning.name;
      if (modules_.CanTell() && !modules_.Has(name) && !IsMissingByDefault(line.database, name)) {
        Add(line, name, "the library folders have no module libnss_" + name + ".so.2",
            "install the package that brings it, or take the service out: velmorctl nss remove " +
                line.database + " " + name + modules_.Root().Option());
      }
    }
  }

  void CheckLocalFirst(const SwitchLine& line) {
    if (!IsLocalService(line.services.front().meaning.name)) {
      Add(line, line.services.front().meaning.name,
          "the service is asked before \"files\", so that local accounts depend on it",
          "put files first in the line");
    }
  }

  /// Reports the services behind one that ends the search where they would have to go on.
  void CheckReach(const SwitchLine& line) {
    for (auto service = line.services.begin(); service != line.services.end(); ++service) {
      // "files" always has an answer; other services may be there for a part of the names only.
      const bool endsSearch = service->actions.AlwaysReturn() ||
                              (HoldsLocalAccounts(line.database) && IsLocalService(service->meaning.name) &&
                               service->actions.For(LookupStatus::NotFound) == LookupAction::Return);
      if (endsSearch && service + 1 != line.services.end()) {
        Add(line, (service + 1)->meaning.name,
            "the service is never asked, because of the brackets behind \"" + service->meaning.name + "\"",
            "remove the brackets, or the services behind them");
        return;
      }
    }
  }

  const SwitchFile& file_;
  const std::string& shown_;
  const ServiceModules& modules_;
  std::vector<FileProblem> problems_;
};

}  // namespace

std::vector<FileProblem> CheckSwitchFile(const SwitchFile& file, const std::string& shown,
                                         const ServiceModules& modules) {
  return Check(file, shown, modules).Run();
}

}  // namespace velmorctl
