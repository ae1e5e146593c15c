#include "cam_settings.h"

#include <unistd.h>

#include <cerrno>
#include <charconv>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string_view>

#include "failure.h"
#include "hostmgmt/replace_file.h"
#include "text.h"

namespace velmorctl {

namespace {

constexpr std::string_view pinKey = "sha256";

/// A text that may hold the token.
class Content {
 public:
  explicit Content(std::string text) : text_(std::move(text)) {}
  Content(const Content&) = delete;
  Content& operator=(const Content&) = delete;
  ~Content() { explicit_bzero(text_.data(), text_.size()); }

  const std::string& Text() const { return text_; }

 private:
  std::string text_;
};

Failure Fault(const std::string& reason) {
  return Failure(ExitCode::Configuration, "the settings of the CAM proxy plug-in cannot be used")
      .Detail("file", camSettingsFile)
      .Detail("reason", reason);
}

bool FileExists() {
  std::error_code error;
  return std::filesystem::exists(camSettingsFile, error) || error;
}

/// Makes room at once and reads past the stream's own buffer, so that no copy of the token stays behind in
/// memory that was given back.
std::string ReadWholeFile() {
  std::ifstream stream;
  stream.rdbuf()->pubsetbuf(nullptr, 0);
  stream.open(camSettingsFile, std::ios::binary);
  if (!stream) {
    int errorNumber = errno;
    Failure failure = Fault(SystemErrorText(errorNumber));
    throw errorNumber == EACCES && geteuid() != 0 ? Failure(ExitCode::NeedsRoot, failure.what())
                                                        .Detail("file", camSettingsFile)
                                                        .Try("run the command as root")
                                                  : failure;
  }
  std::error_code error;
  const auto size = std::filesystem::file_size(camSettingsFile, error);
  if (error || !std::filesystem::is_regular_file(camSettingsFile)) {
    throw Fault("it is not a file");
  }
  std::string text(size, '\0');
  stream.read(text.data(), static_cast<std::streamsize>(size));
  text.resize(static_cast<std::size_t>(stream.gcount()));
  return text;
}

std::string_view Unquoted(std::string_view part) {
  const bool quoted =
      part.size() >= 2 && part.front() == part.back() && (part.front() == '"' || part.front() == '\'');
  return quoted ? part.substr(1, part.size() - 2) : part;
}

/// The line up to its end and without the text behind it, which stays in `text`.
std::string_view TakeLine(std::string_view& text) {
  const auto end = text.find('\n');
  const std::string_view line = text.substr(0, end);
  text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
  return line;
}

std::string_view KeyOf(std::string_view line) {
  return Unquoted(Trimmed(line.substr(0, line.find('='))));
}

bool IsPin(std::string_view key) {
  return key == pinKey || (key.starts_with(pinKey) && key.substr(pinKey.size()).starts_with('-'));
}

void Read(std::string_view line, int number, CamSettings& settings) {
  if (Trimmed(line).empty()) {
    return;
  }
  const auto delimiter = line.find('=');
  if (delimiter == std::string_view::npos) {
    throw Fault("the line has no \"=\" (there are no comments in this format)")
        .Detail("line", std::to_string(number))
        .Try("write the line as: key = \"value\", or remove it");
  }
  const std::string_view key = KeyOf(line);
  const std::string_view value = Unquoted(Trimmed(line.substr(delimiter + 1)));
  if (key == "token") {
    settings.hasToken = !value.empty();
  } else if (IsPin(key)) {
    settings.pins.emplace(key, value);
  } else if (key == "port") {
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), settings.port);
    if (error != std::errc() || end != value.data() + value.size() || settings.port == 0) {
      throw Fault("the port must be a number from 1 to 65535")
          .Detail("line", std::to_string(number))
          .Try("write the line as: port = \"8443\"");
    }
  }
}

}  // namespace

std::string CamSettings::PinFor(const std::string& server) const {
  auto pin = pins.find(std::string(pinKey) + "-" + server);
  if (pin == pins.end()) {
    pin = pins.find(std::string(pinKey));
  }
  return pin == pins.end() ? "" : pin->second;
}

CamSettings ReadCamSettings() {
  CamSettings settings;
  if (!FileExists()) {
    return settings;
  }
  const Content content(ReadWholeFile());
  std::string_view text = content.Text();
  for (int number = 1; !text.empty(); ++number) {
    Read(TakeLine(text), number, settings);
  }
  return settings;
}

void ReplacePins(const std::string& sha256) {
  const Content content(FileExists() ? ReadWholeFile() : "");
  std::string_view text = content.Text();
  std::string edited;
  edited.reserve(text.size() + sha256.size() + 32);
  while (!text.empty()) {
    const std::string_view line = TakeLine(text);
    if (!IsPin(KeyOf(line))) {
      edited.append(line).append("\n");
    }
  }
  if (!sha256.empty()) {
    edited.append(pinKey).append(" = \"").append(sha256).append("\"\n");
  }
  const Content result(std::move(edited));
  if (result.Text() != content.Text()) {
    HostMgmt::ReplaceFile(camSettingsFile, result.Text(), 0600);
  }
}

CamSettingsBackup::CamSettingsBackup() : existed_(FileExists()), content_(existed_ ? ReadWholeFile() : "") {}

CamSettingsBackup::~CamSettingsBackup() {
  explicit_bzero(content_.data(), content_.size());
}

void CamSettingsBackup::Restore() const {
  if (existed_) {
    HostMgmt::ReplaceFile(camSettingsFile, content_, 0600);
  } else {
    unlink(camSettingsFile);
  }
}

}  // namespace velmorctl
