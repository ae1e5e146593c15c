#include "nss/switch_edit.h"

#include <algorithm>
#include <utility>

#include "failure.h"
#include "nss/databases.h"
#include "nss/edit_proof.h"
#include "nss/line_faults.h"
#include "nss/words.h"
#include "text.h"

namespace velmorctl {

namespace {

using Kind = LineFault::Kind;
using Meaning = std::vector<ServiceMeaning>;

bool IsLetterOrDigit(char character) {
  return (character >= 'a' && character <= 'z') || (character >= 'A' && character <= 'Z') ||
         (character >= '0' && character <= '9');
}

void RequireServiceName(const std::string& name) {
  if (!IsServiceName(name)) {
    throw Failure(ExitCode::Usage, "'" + name + "' cannot be the name of a service")
        .Try("give a name such as winbind, of letters, digits, \"_\", \"-\", \"+\" and \".\"");
  }
}

Failure Refusal(const std::string& shown, const SwitchLine& line, const std::string& happened,
                const std::string& reason) {
  return Failure(ExitCode::Usage, happened)
      .Detail("file", shown)
      .Detail("line", std::to_string(line.number))
      .Detail("reason", reason);
}

/// Faults that make uncertain what an edit of this line would mean.
void RequireSound(const SwitchLine& line, const std::string& shown) {
  for (const LineFault& fault : line.faults) {
    if (fault.kind != Kind::Remark) {
      throw AsFailure(FaultProblem(fault, line, shown), ExitCode::Configuration,
                      "the line of \"" + line.database + "\" cannot be changed safely");
    }
  }
}

/// The database's line; null when there is none.
const SwitchLine* LineToEdit(const SwitchFile& file, const std::string& shown, const std::string& database) {
  for (const SwitchLine& line : file.Lines()) {
    if (line.Has(Kind::BadCriterion) && IsLibraryDatabase(line.database)) {
      RequireSound(line, shown);
    }
  }
  const std::vector<const SwitchLine*> lines = file.LinesOf(database);
  if (lines.size() > 1) {
    throw Failure(ExitCode::Configuration, "the database \"" + database + "\" has several lines")
        .Detail("file", shown)
        .Detail("line",
                std::to_string(lines.front()->number) + " and " + std::to_string(lines.back()->number))
        .Try("remove all lines of the database but the last, which is the one that counts");
  }
  if (lines.empty()) {
    return nullptr;
  }
  RequireSound(*lines.front(), shown);
  return lines.front();
}

std::string Written(const ServiceMeaning& service) {
  return service.criterion.empty() ? service.name : service.name + " [" + Join(service.criterion, " ") + "]";
}

bool IsLocalFirst(const std::string& database, const Meaning& services) {
  return HoldsLocalAccounts(database) && !services.empty() && IsLocalService(services.front().name);
}

bool HasLocal(const Meaning& services) {
  return std::any_of(services.begin(), services.end(),
                     [](const ServiceMeaning& service) { return IsLocalService(service.name); });
}

/// Before which service the new one goes.
std::size_t PlaceOf(const ServiceMeaning& service, const std::string& after, const SwitchLine& line,
                    const std::string& shown) {
  if (!after.empty()) {
    const SwitchService* before = line.Find(after);
    if (before == nullptr) {
      throw Refusal(shown, line, "\"" + line.database + "\" does not have the service \"" + after + "\"",
                    "the new service is to stand behind it")
          .Try("leave --after out, and the service is put at the end");
    }
    return static_cast<std::size_t>(before - line.services.data()) + 1;
  }
  const bool goesFirst =
      HoldsLocalAccounts(line.database) && IsLocalService(service.name) && !HasLocal(line.Meaning());
  return goesFirst ? 0 : line.services.size();
}

/// Refuses a directory's service that is asked before the local files could answer for root.
void RequireBehindLocal(const std::string& shown, const SwitchLine& line, std::size_t place) {
  const auto local =
      std::find_if(line.services.begin(), line.services.end(),
                   [](const SwitchService& service) { return IsLocalService(service.meaning.name); });
  if (local - line.services.begin() < static_cast<std::ptrdiff_t>(place) || local == line.services.end()) {
    return;
  }
  const std::string& name = local->meaning.name;
  throw Refusal(shown, line, "the service would be asked before \"" + name + "\"",
                "local accounts would depend on it")
      .Try("put it behind the local files, with --after " + name + " or without --after");
}

void RequireLocalStaysFirst(const std::string& shown, const SwitchLine& line, const Meaning& wanted) {
  const bool wasFirst = IsLocalFirst(line.database, line.Meaning());
  const bool hadLocal = HoldsLocalAccounts(line.database) && HasLocal(line.Meaning());
  if ((wasFirst && !IsLocalFirst(line.database, wanted)) || (hadLocal && !HasLocal(wanted))) {
    throw Refusal(shown, line, "\"files\" or \"compat\" must stay first in \"" + line.database + "\"",
                  "without it no local account, root included, could log in while the directory is away")
        .Try("leave the service in its place");
  }
}

/// The C library reads past the end of a list without services.
void RequireServicesLeft(const std::string& shown, const SwitchLine& line, const Meaning& wanted) {
  if (wanted.empty() && IsLibraryDatabase(line.database)) {
    throw Refusal(shown, line, "\"" + line.database + "\" would have no services left",
                  "programs that look something up in such a database may crash")
        .Try("add another service first, or remove the whole line by hand");
  }
}

/// Refuses a service that is there with brackets that mean something else than those it needs.
void RequireCriterion(const std::string& shown, const SwitchLine& line, const SwitchService& present,
                      const ServiceMeaning& needed) {
  const std::string criterion = Join(needed.criterion, " ");
  if (!needed.criterion.empty() && ParseCriterion(criterion) != present.actions) {
    throw Failure(ExitCode::Configuration, "\"" + line.database + "\" has the service \"" + needed.name +
                                               "\", but not as the provider needs it")
        .Detail("file", shown)
        .Detail("line", std::to_string(line.number))
        .Detail("reason", "the provider needs [" + criterion + "] behind it")
        .Try("write these brackets behind the service, in place of any that stand there");
  }
}

/// The text with `insertion` put in, and a blank behind it where a word would follow at once.
std::string WithInsertion(const std::string& text, std::size_t position, std::string insertion) {
  if (position < text.size() && !IsSpace(text[position]) && !IsSpace(insertion.back())) {
    insertion += ' ';
  }
  std::string result = text;
  return result.insert(position, insertion);
}

std::string InsertBefore(const SwitchFile& file, const SwitchLine& line, std::size_t place,
                         const std::string& written) {
  if (line.services.empty()) {
    // Behind the blanks that are there: the model of the switch refuses a file with one behind a service.
    const std::size_t position = std::min(file.Text().find_first_not_of(" \t", line.servicesBegin), line.end);
    return WithInsertion(file.Text(), position, position > line.servicesBegin ? written : " " + written);
  }
  if (place == 0) {
    return WithInsertion(file.Text(), line.services.front().begin, written + " ");
  }
  return WithInsertion(file.Text(), line.services[place - 1].end, " " + written);
}

/// Services that end the search when they do not know a name, and so keep it from the new one.
std::vector<std::string> WarningsFor(const Meaning& wanted, std::size_t place, const SwitchLine& line) {
  std::vector<std::string> warnings;
  for (std::size_t index = 0; index < place && index < line.services.size(); ++index) {
    const SwitchService& service = line.services[index];
    if (service.actions.For(LookupStatus::NotFound) == LookupAction::Return) {
      warnings.push_back("\"" + wanted[place].name + "\" is not asked for what \"" + service.meaning.name +
                         "\" does not find, because of [" + Join(service.meaning.criterion, " ") + "] in \"" +
                         line.database + "\"");
    }
  }
  return warnings;
}

SwitchEdit AddToLine(const SwitchFile& file, const std::string& shown, const SwitchLine& line,
                     const ServiceMeaning& service, const std::string& after) {
  const std::size_t place = PlaceOf(service, after, line, shown);
  Meaning wanted = line.Meaning();
  std::string written = Written(service);
  if (wanted.empty() && HoldsLocalAccounts(line.database) && !IsLocalService(service.name)) {
    wanted = {{"files", {}}, service};
    written = "files " + written;
  } else {
    wanted.insert(wanted.begin() + static_cast<std::ptrdiff_t>(place), service);
  }
  RequireLocalStaysFirst(shown, line, wanted);
  if (HoldsLocalAccounts(line.database) && !IsLocalService(service.name)) {
    RequireBehindLocal(shown, line, place);
  }
  SwitchEdit edit = {InsertBefore(file, line, place, written), {}};
  ProveEdit(file, SwitchFile(edit.content), shown, {line.number, line.database, wanted});
  if (wanted.size() == line.services.size() + 1) {
    edit.warnings = WarningsFor(wanted, place, line);
  }
  if (HoldsLocalAccounts(line.database) && !HasLocal(wanted)) {
    edit.warnings.push_back("\"" + line.database +
                            "\" has neither \"files\" nor \"compat\", so that no local account is found");
  }
  return edit;
}

/// The line end that the file uses.
std::string LineEnd(const std::string& text) {
  const std::size_t first = text.find('\n');
  return first != std::string::npos && first > 0 && text[first - 1] == '\r' ? "\r\n" : "\n";
}

SwitchEdit AddLine(const SwitchFile& file, const std::string& shown, const std::string& database,
                   const ServiceMeaning& service, const std::string& after) {
  if (!DefaultsToFiles(database)) {
    throw Failure(ExitCode::Usage, "the database \"" + database + "\" has no line")
        .Detail("file", shown)
        .Detail("reason", IsKnownDatabase(database)
                              ? "what is consulted without a line is not \"files\" alone, and would be lost"
                              : "no program is known that reads a database of this name")
        .Try("check the name, or write the line by hand, for example \"" + database + ": files\"");
  }
  if (!after.empty() && after != "files") {
    throw Failure(ExitCode::Usage, "\"" + database + "\" does not have the service \"" + after + "\"")
        .Detail("file", shown)
        .Detail("reason", "it has no line, so that \"files\" alone is consulted")
        .Try("leave --after out, and the service is put behind \"files\"");
  }
  if (!file.Text().empty() && file.Text().back() != '\n') {
    // A newline before the new line would make the C library read a line that it does not read now.
    throw Failure(ExitCode::Configuration, "no line can be added safely")
        .Detail("file", shown)
        .Detail("reason", "the last line is not ended by a newline, so the C library does not read it")
        .Try("end the last line with a newline, or remove it");
  }
  Meaning wanted = {{"files", {}}};
  if (service.name != "files") {
    wanted.push_back(service);
  }
  std::string line = database + ":";
  for (const ServiceMeaning& word : wanted) {
    line += " " + Written(word);
  }
  SwitchEdit edit = {file.Text() + line + LineEnd(file.Text()), {}};
  const auto number = static_cast<int>(std::count(file.Text().begin(), file.Text().end(), '\n')) + 1;
  ProveEdit(file, SwitchFile(edit.content), shown, {number, database, wanted});
  return edit;
}

/// Takes out the service with the blanks before it or, when it is the first of several, those behind it;
/// where the next word follows at once, the blanks before it stay as its separator.
std::string WithoutService(const SwitchFile& file, const SwitchLine& line, std::size_t index) {
  const std::string& text = file.Text();
  const SwitchService& service = line.services[index];
  std::size_t begin = index == 0 ? line.servicesBegin : line.services[index - 1].end;
  std::size_t end = service.end;
  if (index == 0 && line.services.size() > 1) {
    begin = service.begin;
    end = line.services[1].begin;
  } else if (end < text.size() && !IsSpace(text[end])) {
    begin = service.begin;
  }
  return text.substr(0, begin) + text.substr(end);
}

}  // namespace

bool IsServiceName(std::string_view text) {
  return !text.empty() && text.front() != '.' && std::all_of(text.begin(), text.end(), [](char character) {
    return IsLetterOrDigit(character) || std::string_view("_-+.").find(character) != std::string_view::npos;
  });
}

SwitchEdit AddService(const SwitchFile& file, const std::string& shown, const std::string& database,
                      const ServiceMeaning& service, const std::string& after) {
  RequireServiceName(service.name);
  const SwitchLine* line = LineToEdit(file, shown, database);
  if (line == nullptr) {
    return AddLine(file, shown, database, service, after);
  }
  if (const SwitchService* present = line->Find(service.name)) {
    RequireCriterion(shown, *line, *present, service);
    return {file.Text(), {}};
  }
  return AddToLine(file, shown, *line, service, after);
}

SwitchEdit RemoveService(const SwitchFile& file, const std::string& shown, const std::string& database,
                         const std::string& service) {
  RequireServiceName(service);
  const SwitchLine* line = LineToEdit(file, shown, database);
  if (line == nullptr) {
    if (!IsKnownDatabase(database)) {
      throw Failure(ExitCode::Usage, "the database \"" + database + "\" has no line")
          .Detail("file", shown)
          .Try("\"velmorctl nss show\" shows the databases");
    }
    return {file.Text(), {}};
  }
  SwitchEdit edit = {file.Text(), {}};
  Meaning wanted = line->Meaning();
  // From the end, so that the places of the others stay.
  for (std::size_t index = line->services.size(); index-- > 0;) {
    if (line->services[index].meaning.name == service) {
      wanted.erase(wanted.begin() + static_cast<std::ptrdiff_t>(index));
      const SwitchFile now(edit.content);
      edit.content = WithoutService(now, *now.LinesOf(database).front(), index);
    }
  }
  if (edit.content == file.Text()) {
    return edit;
  }
  RequireLocalStaysFirst(shown, *line, wanted);
  RequireServicesLeft(shown, *line, wanted);
  ProveEdit(file, SwitchFile(edit.content), shown, {line->number, database, wanted});
  return edit;
}

}  // namespace velmorctl
