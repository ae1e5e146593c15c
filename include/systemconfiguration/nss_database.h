#ifndef SYSTEMCONFIGURATION_NSS_DATABASE_H
#define SYSTEMCONFIGURATION_NSS_DATABASE_H

#include <cstdint>
#include <string>

#include "systemconfiguration/export.h"

namespace SystemConfiguration {

/// The name of one database of the name-service switch.
///
/// Converts from and to its value and its text without being asked, so that it can stand for either.
///
/// A plain value: distinct objects may be used by distinct threads at once; one object may be read by several
/// threads as long as none changes it.
class SYSTEMCONFIGURATION_EXPORT NSSDatabase {
 public:
  /// The numbers order the lines of a written file.
  enum Database : std::uint32_t {
    Passwd = 1,
    Group = 2,
    Shadow = 3,
    Hosts = 4,
    Netmasks = 5,
    Networks = 6,
    Protocols = 7,
    Services = 8,
    Ethers = 9,
    Rpc = 10,
    Netgroup = 11,
    Bootparams = 12,
    Publickey = 13,
    Automount = 14,
    Aliases = 15
  };

  /// No database: the value is 0, which has no keyword. Assign before use.
  NSSDatabase();

  NSSDatabase(Database value);  // NOLINT(google-explicit-constructor): callers rely on it

  /// Reads a keyword; case matters. Throws InvalidDatabaseException for any other word.
  NSSDatabase(const std::string& word);  // NOLINT(google-explicit-constructor): callers rely on it

  NSSDatabase& operator=(Database value);

  /// Like the constructor from a word. Throws InvalidDatabaseException; this object is unchanged then.
  NSSDatabase& operator=(const std::string& word);

  bool operator==(const NSSDatabase& other) const;
  bool operator==(Database value) const;

  /// Reads the word as the constructor does and compares values. Throws InvalidDatabaseException.
  bool operator==(const std::string& word) const;

  /// The keyword. Throws InvalidDatabaseException for values outside the enumeration. Deliberate: its message
  /// is "Invalid Database: " less as many leading characters as the value says.
  operator std::string() const;  // NOLINT(google-explicit-constructor): callers rely on it

  /// The value.
  operator Database() const;  // NOLINT(google-explicit-constructor): callers rely on it

 private:
  Database value_;
};

}  // namespace SystemConfiguration

#endif
