/// The root of every failure that leaves the library.
#ifndef AUTHENTICATION_EXCEPTION_H
#define AUTHENTICATION_EXCEPTION_H

#include <exception>
#include <string>

#include "authentication/export.h"

namespace quenix::authentication {

/// A failure: a numeric code and a text that is ready to be shown.
///
/// Immutable after construction, so any number of threads may read one. An exception that was caught on one
/// thread can be kept with Clone() and thrown on another one with Throw(), which keep its exact class.
class VELMOR_EXPORT Exception : public std::exception {
 public:
  /// A failure without a code: Code() is 0 and what() is `message` as it stands.
  explicit Exception(const std::string& message);

  /// A failure with a code: what() is "Exception 0x", the code in at least eight lower-case hexadecimal
  /// digits, a colon, a blank and `message`.
  Exception(unsigned long code, const std::string& message);

  Exception(const Exception& other);
  Exception& operator=(const Exception& other) = delete;
  ~Exception() override;

  /// The complete text; valid as long as this object.
  const char* what() const noexcept override;

  /// Returns a new object of the same class, code and text; the caller owns it and deletes it.
  virtual Exception* Clone() const;

  /// Throws a copy of this object, of the same class. This object stays with its owner.
  [[noreturn]] virtual void Throw() const;

  /// The code in the numbering of the Windows system errors; 0 for a failure that has only a text.
  unsigned long Code() const noexcept { return code_; }

 private:
  unsigned long code_;
  std::string message_;
};

}  // namespace quenix::authentication

/// What every subclass of Exception overrides. The destructor is defined out of line, so that the class's one
/// typeinfo lives in the library and a handler in any shared object matches it.
#define VELMOR_EXCEPTION_OPERATIONS(Class) \
  Class(const Class& other);               \
  Class& operator=(const Class&) = delete; \
  ~Class() override;                       \
  Exception* Clone() const override;       \
  [[noreturn]] void Throw() const override;

#endif  // AUTHENTICATION_EXCEPTION_H
