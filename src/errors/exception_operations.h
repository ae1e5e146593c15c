/// The definitions that VELMOR_EXCEPTION_OPERATIONS declares.
#ifndef ERRORS_EXCEPTION_OPERATIONS_H
#define ERRORS_EXCEPTION_OPERATIONS_H

#define VELMOR_DEFINE_EXCEPTION_OPERATIONS(Class) \
  Class::Class(const Class&) = default;           \
  Class::~Class() = default;                      \
  Exception* Class::Clone() const {               \
    return new Class(*this);                      \
  }                                               \
  void Class::Throw() const {                     \
    throw Class(*this);                           \
  }

#endif  // ERRORS_EXCEPTION_OPERATIONS_H
