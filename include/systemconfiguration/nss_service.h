#ifndef SYSTEMCONFIGURATION_NSS_SERVICE_H
#define SYSTEMCONFIGURATION_NSS_SERVICE_H

#include <iosfwd>
#include <list>
#include <string>

#include "systemconfiguration/export.h"

namespace SystemConfiguration {

/// One source that a database of the name-service switch consults, with the words of its criterion.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it.
class SYSTEMCONFIGURATION_EXPORT NSSService {
 public:
  /// No parameters.
  explicit NSSService(const std::string& module);

  /// The service's name as written.
  const std::string& module() const;

  /// The words of the bracketed criterion in order (NOTFOUND=return), to be read and changed in place; none
  /// when the service has no criterion.
  std::list<std::string>& parameters();
  const std::list<std::string>& parameters() const;

  /// Equal modules and parameters.
  bool operator==(const NSSService& other) const;

 private:
  std::string module_;
  std::list<std::string> parameters_;
};

/// Writes the name and, when there are parameters, a blank and the parameters in brackets.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream, const NSSService& service);

}  // namespace SystemConfiguration

#endif
