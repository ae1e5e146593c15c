#ifndef SYSTEMCONFIGURATION_NSS_CONFIGURATION_H
#define SYSTEMCONFIGURATION_NSS_CONFIGURATION_H

#include <deque>
#include <iosfwd>
#include <map>

#include "systemconfiguration/export.h"
#include "systemconfiguration/nss_database.h"
#include "systemconfiguration/nss_service.h"

namespace SystemConfiguration {

/// The name-service switch file: for each database the services to consult, in order.
///
/// The model keeps meaning, not layout, and its reader is forgiving to a fault: a configuration that was read
/// and is written again loses comments, unknown databases, the order of the lines, and what the reader passed
/// over. Compare before replacing a file.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it. Opening and replacing files is the caller's.
class SYSTEMCONFIGURATION_EXPORT NSSConfiguration {
 public:
  /// A configuration without databases.
  NSSConfiguration();

  /// The services of a database, put in empty when the configuration had none. The reference stays valid as
  /// long as the configuration lives and is not assigned to.
  std::deque<NSSService>& operator[](NSSDatabase database);

 private:
  friend SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream,
                                                             const NSSConfiguration& configuration);

  std::map<NSSDatabase, std::deque<NSSService>> databases_;  // ordered by the databases' numbers
};

/// Writes one line for each database, by their numbers, an empty one too, and flushes after each; may block
/// as long as the stream's device does. Throws InvalidDatabaseException at a database without a keyword; the
/// lines before it are written then.
SYSTEMCONFIGURATION_EXPORT std::ostream& operator<<(std::ostream& stream,
                                                    const NSSConfiguration& configuration);

/// Reads lines to the end of the stream and appends their services to those that the configuration already
/// has; a stream that has failed before is left alone. Afterwards the stream has reached its end and failed,
/// as after any loop over its lines.
///
/// Deliberate, because callers rely on what it accepts:
/// - A line whose first word, less its last character, is no database is passed over without a word; so is a
///   database with a blank before the colon or none behind it.
/// - A criterion is seen only one character behind its service, and what follows a ']' on the line is read
/// from
///   far behind it: the services after a criterion are lost, or begin in the middle of a word.
///
/// Throws std::out_of_range at a line that ends with exactly one character of white space behind a service,
/// as lines ending in a carriage return do; the services read before that one stay in the configuration.
SYSTEMCONFIGURATION_EXPORT std::istream& operator>>(std::istream& stream, NSSConfiguration& configuration);

}  // namespace SystemConfiguration

#endif
