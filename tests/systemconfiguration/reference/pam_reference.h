#ifndef TESTS_SYSTEMCONFIGURATION_REFERENCE_PAM_REFERENCE_H
#define TESTS_SYSTEMCONFIGURATION_REFERENCE_PAM_REFERENCE_H

#include <deque>
#include <istream>
#include <list>
#include <map>
#include <ostream>
#include <stdexcept>
#include <string>

// A second, deliberately plain reader and writer of PAM policies that shares no code with the library. It
// uses one stream operation for each step and never looks ahead, so that it can be checked by reading it.
namespace reference {

class InvalidControl : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

class InvalidFacility : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

struct PamEntry {
  unsigned control = 0;
  std::string controlText;
  std::string module;
  std::list<std::string> parameters;
};

struct PamPolicy {
  std::map<unsigned, std::deque<PamEntry>> stacks;
};

unsigned ControlNumber(const std::string& text);
std::string ControlWord(const PamEntry& entry);
unsigned FacilityNumber(const std::string& word);
std::string FacilityWord(unsigned facility);

void ReadFacility(std::istream& stream, unsigned& facility);
void ReadEntry(std::istream& stream, PamEntry& entry);
void ReadPolicy(std::istream& stream, PamPolicy& policy);

void WriteEntry(std::ostream& stream, const PamEntry& entry);
void WritePolicy(std::ostream& stream, const PamPolicy& policy);

}  // namespace reference

#endif
