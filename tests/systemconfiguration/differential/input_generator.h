/// Inputs for the differential test, the same ones in every run.
#ifndef DIFFERENTIAL_INPUT_GENERATOR_H
#define DIFFERENTIAL_INPUT_GENERATOR_H

#include <cstdint>
#include <random>
#include <string>
#include <vector>

#include "systemconfiguration/differential/input_case.h"

namespace differential {

/// Draws files that look like what one of the readers expects, with errors strewn in, and sometimes mere
/// words or mere bytes; half of them with streams that are set up oddly.
class InputGenerator {
 public:
  enum class Format { PamPolicy, PamEntry, NameServiceSwitch };

  InputGenerator(Format format, std::uint64_t seed);

  InputCase Next();

 private:
  std::size_t Below(std::size_t limit);
  bool OneIn(std::size_t chances);
  const std::string& Pick(const std::vector<std::string>& choices);
  std::string Separator();
  std::string LineEnd();
  std::string PamLine();
  std::string PamEntryLine();
  std::string NssLine();
  std::string Line();
  std::string Words();
  std::string Bytes();

  Format format_;
  std::mt19937_64 random_;
};

}  // namespace differential

#endif  // DIFFERENTIAL_INPUT_GENERATOR_H
