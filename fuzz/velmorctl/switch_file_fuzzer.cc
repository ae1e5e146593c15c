// A switch file that is read has the bytes it had, every word stands where the reader says, and a service
// that is added and taken out again leaves nothing behind.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "failure.h"
#include "nss/switch_edit.h"
#include "nss/switch_file.h"
#include "require.h"

namespace {

using velmorctl::SwitchEdit;
using velmorctl::SwitchFile;
using velmorctl::SwitchLine;
using velmorctl::SwitchService;

constexpr char SHOWN[] = "/etc/nsswitch.conf";
constexpr char SERVICE[] = "new";

void CheckLine(const std::string& text, const SwitchLine& line) {
  Require(line.begin <= line.servicesBegin && line.servicesBegin <= line.end && line.end <= text.size(),
          "a line lies in the text");
  Require(line.end == text.size() || text[line.end] == '\n', "a line ends at a newline");
  std::size_t last = line.servicesBegin;
  for (const SwitchService& service : line.services) {
    Require(last <= service.begin && service.begin < service.end && service.end <= line.end,
            "services stand in their order");
    Require(text.compare(service.begin, service.meaning.name.size(), service.meaning.name) == 0,
            "a service stands where it begins");
    last = service.end;
  }
}

/// The library's model of the switch, which is asked about every edit, refuses a carriage return behind a
/// service.
bool IsSound(const SwitchFile& file) {
  return file.Text().find('\r') == std::string::npos &&
         std::all_of(file.Lines().begin(), file.Lines().end(),
                     [](const SwitchLine& line) { return line.faults.empty(); });
}

/// The edit, or nothing when it is refused. In a sound file every edit can be proved.
template <class Edit>
std::optional<std::string> Try(const SwitchFile& file, Edit edit) {
  try {
    return edit().content;
  } catch (const velmorctl::Failure& failure) {
    Require(failure.Code() != velmorctl::ExitCode::Other || !IsSound(file), "an edit can be proved");
    return std::nullopt;
  }
}

/// Whether only what was put in must go again: a line without services also gets "files", and a comment that
/// follows at once also a blank before it.
bool CanBeUndone(const SwitchFile& file, const SwitchLine& line) {
  if (line.services.empty() || line.Find(SERVICE) != nullptr) {
    return false;
  }
  const std::size_t end = line.services.back().end;
  return end == line.end || file.Text()[end] != '#';
}

void CheckEdit(const SwitchFile& file, const SwitchLine& line) {
  const std::optional<std::string> added = Try(file, [&] {
    return velmorctl::AddService(file, SHOWN, line.database, {SERVICE, {}}, "");
  });
  if (!added || !CanBeUndone(file, line)) {
    return;
  }
  const SwitchFile edited(*added);
  const std::optional<std::string> removed =
      Try(edited, [&] { return velmorctl::RemoveService(edited, SHOWN, line.database, SERVICE); });
  Require(removed == file.Text() || (!removed && !IsSound(file)),
          "nothing is left of a service that was taken out again");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  const SwitchFile file(text);
  Require(file.Text() == text, "the file has the bytes it was made of");
  for (const SwitchLine& line : file.Lines()) {
    CheckLine(text, line);
    CheckEdit(file, line);
  }
  return 0;
}
