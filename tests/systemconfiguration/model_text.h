/// Models from text and text from models.
#ifndef SYSTEMCONFIGURATION_TESTS_MODEL_TEXT_H
#define SYSTEMCONFIGURATION_TESTS_MODEL_TEXT_H

#include <sstream>
#include <string>

#include "systemconfiguration/systemconfiguration.h"

namespace testsupport {

inline SystemConfiguration::PAMPolicy ReadPolicy(const std::string& text) {
  std::istringstream stream(text);
  SystemConfiguration::PAMPolicy policy("test");
  stream >> policy;
  return policy;
}

inline SystemConfiguration::NSSConfiguration ReadConfiguration(const std::string& text) {
  std::istringstream stream(text);
  SystemConfiguration::NSSConfiguration configuration;
  stream >> configuration;
  return configuration;
}

template <class Model>
std::string Written(const Model& model) {
  std::ostringstream stream;
  stream << model;
  return stream.str();
}

}  // namespace testsupport

#endif  // SYSTEMCONFIGURATION_TESTS_MODEL_TEXT_H
