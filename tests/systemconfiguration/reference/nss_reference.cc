#include "systemconfiguration/reference/nss_reference.h"

#include <sstream>
#include <vector>

namespace reference {
namespace {

const std::vector<std::string>& Words() {
  static const std::vector<std::string> words = {
      "",         "passwd", "group", "shadow",   "hosts",      "netmasks",  "networks",  "protocols",
      "services", "ethers", "rpc",   "netgroup", "bootparams", "publickey", "automount", "aliases"};
  return words;
}

void ReadServices(std::istringstream& words, const std::string& line, std::deque<NssService>& services,
                  std::size_t size) {
  while (!words.fail()) {
    std::string word;
    words >> word;
    if (word.empty()) return;
    NssService service{word, {}};
    const std::streamoff position = words.tellg();
    if (position != -1 && static_cast<std::size_t>(position) < size) {
      const std::size_t next = static_cast<std::size_t>(position) + 1;
      const std::size_t closing = line.find(']', next);
      if (line.at(next) == '[') {
        const std::string criterion =
            closing == std::string::npos ? line.substr(next + 1) : line.substr(next + 1, closing - next - 1);
        std::istringstream parameters(criterion);
        std::string parameter;
        while (parameters >> parameter) service.parameters.push_back(parameter);
      }
      words.seekg(static_cast<std::streamoff>(next + closing));
    }
    services.push_back(service);
  }
}

}  // namespace

unsigned DatabaseNumber(const std::string& word) {
  for (unsigned number = 1; number < Words().size(); ++number) {
    if (Words()[number] == word) return number;
  }
  throw InvalidDatabase("Invalid Database: " + word);
}

std::string DatabaseWord(unsigned database) {
  if (database >= 1 && database < Words().size()) return Words()[database];
  const std::string literal = "Invalid Database: ";
  throw InvalidDatabase(database < literal.size() ? literal.substr(database) : std::string());
}

void ReadConfiguration(std::istream& stream, NssConfiguration& configuration) {
  if (stream.fail()) return;
  std::string line;
  while (std::getline(stream, line, '\n')) {
    if (line.empty() || line[0] == '#') continue;
    while (!line.empty() && std::string(" \t\r\n").find(line[0]) != std::string::npos) line.erase(0, 1);
    if (line.empty()) continue;
    std::istringstream words(line);
    std::string name;
    words >> name;
    if (!name.empty()) name.erase(name.size() - 1);
    unsigned database = 0;
    try {
      database = DatabaseNumber(name);
    } catch (const InvalidDatabase&) {
      continue;
    }
    std::deque<NssService> services;
    const auto append = [&] {
      if (!services.empty()) {
        std::deque<NssService>& queue = configuration.databases[database];
        queue.insert(queue.end(), services.begin(), services.end());
      }
    };
    try {
      ReadServices(words, line, services, line.size());
    } catch (const std::out_of_range&) {
      append();
      throw;
    }
    append();
  }
}

void WriteConfiguration(std::ostream& stream, const NssConfiguration& configuration) {
  for (const auto& [database, services] : configuration.databases) {
    stream << DatabaseWord(database);
    stream << ":";
    for (const NssService& service : services) {
      stream << " ";
      stream << service.module;
      if (!service.parameters.empty()) {
        stream << " [";
        bool first = true;
        for (const std::string& parameter : service.parameters) {
          if (!first) stream << " ";
          first = false;
          stream << parameter;
        }
        stream << "]";
      }
    }
    stream << std::endl;
  }
}

}  // namespace reference
