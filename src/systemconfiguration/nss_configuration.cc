#include "systemconfiguration/nss_configuration.h"

#include <istream>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>

#include "nss_database_keywords.h"
#include "words.h"

namespace SystemConfiguration {
namespace {

constexpr std::string_view trimmedCharacters = " \t\r\n";

// Reads one line, which has no leading white space.
class NSSLineReader {
 public:
  NSSLineReader(const std::string& line, const WhiteSpace& whiteSpace)
      : line_(line), whiteSpace_(whiteSpace), words_(line, whiteSpace) {}

  // The first word without its last character, which is not looked at.
  std::optional<NSSDatabase> ReadDatabase() {
    std::string_view word = words_.Next();
    word.remove_suffix(word.empty() ? 0 : 1);
    if (const auto value = FindValue(databaseKeywords, word)) return NSSDatabase(*value);
    return std::nullopt;
  }

  // Empty at the end of the line.
  std::optional<NSSService> ReadService() {
    const std::string_view word = words_.Next();
    if (word.empty()) return std::nullopt;
    NSSService service{std::string(word)};
    if (words_.Position() < line_.size()) ReadCriterion(service);
    return service;
  }

 private:
  // Throws std::out_of_range when the line ends with the one character behind the service.
  void ReadCriterion(NSSService& service) {
    const std::size_t next = words_.Position() + 1;
    const bool hasCriterion = line_.at(next) == '[';
    const std::size_t closing = FindClosingBracket(next);
    if (hasCriterion) {
      const std::size_t length = closing == std::string::npos ? closing : closing - next - 1;
      AppendWords(std::string_view(line_).substr(next + 1, length), whiteSpace_, service.parameters());
    }
    // Deliberate: an index is added to an index, which leads far behind the bracket, mostly out of the line.
    if (closing != std::string::npos) words_.MoveTo(next + closing);
  }

  // Remembers that there is none left, lest a long line without brackets be searched again for each service.
  std::size_t FindClosingBracket(std::size_t from) {
    if (!bracketAhead_) return std::string::npos;
    const std::size_t found = line_.find(']', from);
    bracketAhead_ = found != std::string::npos;
    return found;
  }

  const std::string& line_;
  const WhiteSpace& whiteSpace_;
  WordReader words_;
  bool bracketAhead_ = true;
};

void ReadLine(const std::string& line, const WhiteSpace& whiteSpace, NSSConfiguration& configuration) {
  NSSLineReader reader(line, whiteSpace);
  const std::optional<NSSDatabase> database = reader.ReadDatabase();
  if (!database) return;
  while (std::optional<NSSService> service = reader.ReadService()) {
    configuration[*database].push_back(std::move(*service));
  }
}

void AppendService(std::string& text, const NSSService& service) {
  text.append(1, ' ').append(service.module());
  const char* separator = " [";
  for (const std::string& parameter : service.parameters()) {
    text.append(separator).append(parameter);
    separator = " ";
  }
  if (!service.parameters().empty()) text.append(1, ']');
}

// The same as writing keyword, services and line end one after the other, at a fraction of the cost. Only the
// first word goes through the stream by itself: the stream's width is meant for it.
void WriteLine(std::ostream& stream, const std::string& keyword, const std::deque<NSSService>& services,
               std::string& rest) {
  stream << keyword;
  rest.assign(1, ':');
  for (const NSSService& service : services) AppendService(rest, service);
  rest.append(1, '\n');
  stream.write(rest.data(), static_cast<std::streamsize>(rest.size())).flush();
}

}  // namespace

NSSConfiguration::NSSConfiguration() = default;

std::deque<NSSService>& NSSConfiguration::operator[](NSSDatabase database) {
  return databases_[database];
}

std::ostream& operator<<(std::ostream& stream, const NSSConfiguration& configuration) {
  std::string rest;
  for (const auto& [database, services] : configuration.databases_) {
    WriteLine(stream, static_cast<std::string>(database), services, rest);
  }
  return stream;
}

std::istream& operator>>(std::istream& stream, NSSConfiguration& configuration) {
  if (stream.fail()) return stream;
  const WhiteSpace whiteSpace;
  std::string line;
  while (std::getline(stream, line, '\n')) {
    if (line.empty() || line.front() == '#') continue;
    line.erase(0, line.find_first_not_of(trimmedCharacters));
    if (!line.empty()) ReadLine(line, whiteSpace, configuration);
  }
  return stream;
}

}  // namespace SystemConfiguration
