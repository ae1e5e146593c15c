#include "systemconfiguration/nss_configuration.h"

#include <istream>
#include <list>
#include <optional>
#include <ostream>
#include <string>
#include <string_view>

#include "nss_database_keywords.h"
#include "words.h"

namespace SystemConfiguration {
namespace {

// Saves the allocations by which a text grows.
constexpr std::size_t ordinaryLineLength = 128;

constexpr std::string_view trimmedCharacters = " \t\r\n";

// Takes apart one line, which has no leading white space.
class NSSLineReader {
 public:
  NSSLineReader(const std::string& line, const WhiteSpace& whiteSpace)
      : line_(line), whiteSpace_(whiteSpace), words_(line, whiteSpace) {}

  // The first word without its last character, which is not looked at.
  std::optional<NSSDatabase::Database> TakeDatabase() {
    std::string_view word = words_.Next();
    word.remove_suffix(word.empty() ? 0 : 1);
    return FindValue(databaseKeywords, word);
  }

  // Empty at the end of the line.
  std::string_view TakeModule() { return words_.Next(); }

  // Whether a criterion follows the module just taken.
  // Throws std::out_of_range when the line ends with the one character behind the module.
  bool HasCriterion() const {
    return words_.Position() < line_.size() && line_.at(words_.Position() + 1) == '[';
  }

  void AppendCriterion(std::list<std::string>& parameters) const {
    const std::size_t begin = words_.Position() + 2;
    const std::size_t end = line_.find(']', begin);
    const std::size_t length = end == std::string::npos ? end : end - begin;
    AppendWords(std::string_view(line_).substr(begin, length), whiteSpace_, parameters);
  }

  // Deliberate: the index behind the separator is added to the bracket's own, which leads far behind the
  // bracket, mostly out of the line.
  void SkipBehindBracket() {
    if (!bracketAhead_ || words_.Position() >= line_.size()) return;
    const std::size_t next = words_.Position() + 1;
    const std::size_t closing = line_.find(']', next);
    // Remembered, lest a long line without brackets be searched again for each service.
    bracketAhead_ = closing != std::string::npos;
    if (bracketAhead_) words_.MoveTo(next + closing);
  }

 private:
  const std::string& line_;
  const WhiteSpace& whiteSpace_;
  WordReader words_;
  bool bracketAhead_ = true;
};

void ReadLine(const std::string& line, const WhiteSpace& whiteSpace, NSSConfiguration& configuration) {
  NSSLineReader reader(line, whiteSpace);
  const std::optional<NSSDatabase::Database> database = reader.TakeDatabase();
  if (!database) return;
  std::deque<NSSService>* services = nullptr;  // looked up, and perhaps made, for the first service
  for (std::string_view module = reader.TakeModule(); !module.empty(); module = reader.TakeModule()) {
    const bool hasCriterion = reader.HasCriterion();
    if (services == nullptr) services = &configuration[*database];
    NSSService& service = services->emplace_back(std::string(module));
    if (hasCriterion) reader.AppendCriterion(service.parameters());
    reader.SkipBehindBracket();
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
  rest.reserve(ordinaryLineLength);
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
