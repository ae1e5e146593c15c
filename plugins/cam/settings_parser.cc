#include "settings_parser.h"

#include <arpa/inet.h>

#include <algorithm>
#include <charconv>
#include <set>
#include <string>

#include "failure.h"

namespace camproxy {

namespace {

constexpr std::string_view SHA256_PREFIX = "sha256-";

std::string_view Trimmed(std::string_view text) {
  const auto first = text.find_first_not_of(" \t\r");
  if (first == std::string_view::npos) return {};
  return text.substr(first, text.find_last_not_of(" \t\r") - first + 1);
}

std::string_view Unquoted(std::string_view text) {
  const bool quoted =
      text.size() >= 2 && text.front() == text.back() && (text.front() == '"' || text.front() == '\'');
  return quoted ? text.substr(1, text.size() - 2) : text;
}

bool IsAddress(const std::string& text) {
  in_addr address{};
  return inet_pton(AF_INET, text.c_str(), &address) == 1;
}

bool IsToken(std::string_view text) {
  return std::all_of(text.begin(), text.end(),
                     [](char character) { return character > ' ' && character < 127; });
}

class Parser {
 public:
  void AddLine(std::string_view line) {
    ++number_;
    if (Trimmed(line).empty()) return;
    const auto delimiter = line.find('=');
    if (delimiter == std::string_view::npos) Refuse("has no \"=\"");
    const std::string key(Unquoted(Trimmed(line.substr(0, delimiter))));
    if (!seen_.insert(key).second) Refuse("sets '" + key + "' again");
    Set(key, Unquoted(Trimmed(line.substr(delimiter + 1))));
  }

  Settings Result() && { return std::move(settings_); }

 private:
  [[noreturn]] void Refuse(const std::string& fault) const {
    throw Failure(SETTINGS_FAULT,
                  std::string(SETTINGS_FILE) + ": line " + std::to_string(number_) + " " + fault);
  }

  void Set(const std::string& key, std::string_view value) {
    if (key == "port") {
      settings_.port = static_cast<std::uint16_t>(Number(value, 1, 65535));
    } else if (key == "connect-timeout") {
      settings_.connectTimeout = std::chrono::seconds(Number(value, 1, 600));
    } else if (key == "request-timeout") {
      settings_.requestTimeout = std::chrono::seconds(Number(value, 1, 3600));
    } else if (key == "token") {
      if (!IsToken(value)) Refuse("needs a token of printable characters without blanks");
      settings_.token = value;
    } else if (key == "sha256") {
      settings_.sha256 = Digest(value);
    } else if (key.starts_with(SHA256_PREFIX)) {
      const std::string server = key.substr(SHA256_PREFIX.size());
      if (!IsAddress(server)) Refuse("needs an IPv4 address behind \"sha256-\"");
      settings_.sha256OfServer[server] = Digest(value);
    } else {
      Refuse("has the unknown key '" + key + "'");
    }
  }

  Sha256 Digest(std::string_view value) const {
    const auto digest = ParseSha256(value);
    if (!digest) Refuse("needs a SHA-256 of 64 hexadecimal digits");
    return *digest;
  }

  int Number(std::string_view value, int least, int most) const {
    int number = 0;
    const auto [end, error] = std::from_chars(value.data(), value.data() + value.size(), number);
    if (error != std::errc() || end != value.data() + value.size() || number < least || number > most) {
      Refuse("needs a number from " + std::to_string(least) + " to " + std::to_string(most));
    }
    return number;
  }

  int number_ = 0;
  std::set<std::string> seen_;
  Settings settings_;
};

}  // namespace

Settings ParseSettings(std::string_view text) {
  Parser parser;
  while (!text.empty()) {
    const auto end = std::min(text.find('\n'), text.size());
    parser.AddLine(text.substr(0, end));
    text.remove_prefix(std::min(end + 1, text.size()));
  }
  return std::move(parser).Result();
}

}  // namespace camproxy
