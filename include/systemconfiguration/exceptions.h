#ifndef SYSTEMCONFIGURATION_EXCEPTIONS_H
#define SYSTEMCONFIGURATION_EXCEPTIONS_H

#include <exception>
#include <string>

#include "systemconfiguration/export.h"

/// What the models throw for text and values that have no meaning in them. The three classes are unrelated to
/// each other and to the library's other exceptions; none carries more than its message.
namespace SystemConfiguration {

/// A word that is no control of a PAM policy line, or a control that has no keyword.
class SYSTEMCONFIGURATION_EXPORT InvalidControlException : public std::exception {
 public:
  explicit InvalidControlException(const std::string& message);
  InvalidControlException(const InvalidControlException&) = default;
  InvalidControlException& operator=(const InvalidControlException&) = default;
  ~InvalidControlException() override;

  /// The message given at construction, valid as long as this object.
  const char* what() const noexcept override;

 private:
  std::string message_;
};

/// A word that is no facility of a PAM policy line, or a facility that has no keyword.
class SYSTEMCONFIGURATION_EXPORT InvalidFacilityException : public std::exception {
 public:
  explicit InvalidFacilityException(const std::string& message);
  InvalidFacilityException(const InvalidFacilityException&) = default;
  InvalidFacilityException& operator=(const InvalidFacilityException&) = default;
  ~InvalidFacilityException() override;

  /// The message given at construction, valid as long as this object.
  const char* what() const noexcept override;

 private:
  std::string message_;
};

/// A word that is no database of the name-service switch, or a database that has no keyword.
class SYSTEMCONFIGURATION_EXPORT InvalidDatabaseException : public std::exception {
 public:
  explicit InvalidDatabaseException(const std::string& message);
  InvalidDatabaseException(const InvalidDatabaseException&) = default;
  InvalidDatabaseException& operator=(const InvalidDatabaseException&) = default;
  ~InvalidDatabaseException() override;

  /// The message given at construction, valid as long as this object.
  const char* what() const noexcept override;

 private:
  std::string message_;
};

}  // namespace SystemConfiguration

#endif
