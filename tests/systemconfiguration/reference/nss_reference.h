#ifndef TESTS_SYSTEMCONFIGURATION_REFERENCE_NSS_REFERENCE_H
#define TESTS_SYSTEMCONFIGURATION_REFERENCE_NSS_REFERENCE_H

#include <deque>
#include <istream>
#include <list>
#include <map>
#include <ostream>
#include <stdexcept>
#include <string>

// A second, deliberately plain reader and writer of the name-service switch that shares no code with the
// library. It moves a real string stream about where the library only counts.
namespace reference {

class InvalidDatabase : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct NssService {
  std::string module;
  std::list<std::string> parameters;
};

struct NssConfiguration {
  std::map<unsigned, std::deque<NssService>> databases;
};

unsigned DatabaseNumber(const std::string& word);
std::string DatabaseWord(unsigned database);

void ReadConfiguration(std::istream& stream, NssConfiguration& configuration);
void WriteConfiguration(std::ostream& stream, const NssConfiguration& configuration);

}  // namespace reference

#endif
