#include "systemconfiguration/differential/observation.h"

#include <array>
#include <cstdio>
#include <stdexcept>

#include "systemconfiguration/differential/test_streams.h"
#include "systemconfiguration/reference/nss_reference.h"
#include "systemconfiguration/reference/pam_reference.h"
#include "systemconfiguration/systemconfiguration.h"

namespace differential {

std::string Escaped(const std::string& text) {
  std::string escaped;
  for (const char character : text) {
    const auto code = static_cast<unsigned char>(character);
    if (character == '\n') {
      escaped += "\\n\n      ";
    } else if (code < 0x20 || code >= 0x7f || character == '\\') {
      std::array<char, 5> digits{};
      std::snprintf(digits.data(), digits.size(), "\\x%02x", code);
      escaped += digits.data();
    } else {
      escaped += character;
    }
  }
  return escaped;
}

std::string Ending(const std::function<void()>& operation) {
  try {
    operation();
    return "returned\n";
  } catch (const SystemConfiguration::InvalidControlException& thrown) {
    return std::string("InvalidControlException: ") + thrown.what() + "\n";
  } catch (const reference::InvalidControl& thrown) {
    return std::string("InvalidControlException: ") + thrown.what() + "\n";
  } catch (const SystemConfiguration::InvalidFacilityException& thrown) {
    return std::string("InvalidFacilityException: ") + thrown.what() + "\n";
  } catch (const reference::InvalidFacility& thrown) {
    return std::string("InvalidFacilityException: ") + thrown.what() + "\n";
  } catch (const SystemConfiguration::InvalidDatabaseException& thrown) {
    return std::string("InvalidDatabaseException: ") + thrown.what() + "\n";
  } catch (const reference::InvalidDatabase& thrown) {
    return std::string("InvalidDatabaseException: ") + thrown.what() + "\n";
  } catch (const std::out_of_range& thrown) {
    return std::string("std::out_of_range: ") + thrown.what() + "\n";
  } catch (const std::ios_base::failure& thrown) {
    return std::string("std::ios_base::failure: ") + thrown.what() + "\n";
  } catch (const BufferFault& thrown) {
    return std::string("BufferFault: ") + thrown.what() + "\n";
  }
}

std::string StateOf(const std::ios& stream) {
  std::string state = "state:";
  if (stream.good()) state += " good";
  if (stream.eof()) state += " eof";
  if ((stream.rdstate() & std::ios_base::failbit) != 0) state += " fail";
  if (stream.bad()) state += " bad";
  return state + ", width " + std::to_string(stream.width()) + "\n";
}

std::string Difference(const std::string& library, const std::string& reference) {
  if (library == reference) return "";
  return "--- library\n" + Escaped(library) + "\n--- reference\n" + Escaped(reference) + "\n";
}

}  // namespace differential
