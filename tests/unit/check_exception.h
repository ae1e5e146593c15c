/// What holds for every class of the exception family.
#ifndef UNIT_CHECK_EXCEPTION_H
#define UNIT_CHECK_EXCEPTION_H

#include <gtest/gtest.h>

#include <exception>
#include <memory>
#include <string>
#include <type_traits>
#include <typeinfo>

#include "authentication/exception.h"
#include "support/expect_throw_what.h"

namespace testsupport {

/// Code and text, those of a clone, and the exact class of the clone and of what Throw() throws; that it is
/// caught by the base classes too.
template <class Class>
void CheckException(const Class& exception, unsigned long code, const std::string& text) {
  using quenix::authentication::Exception;
  static_assert(std::is_base_of_v<Exception, Class>);
  EXPECT_EQ(exception.Code(), code);
  EXPECT_EQ(exception.what(), text);

  const Exception& base = exception;
  const std::unique_ptr<const Exception> clone(base.Clone());
  ASSERT_NE(clone, nullptr);
  const Exception& cloned = *clone;
  EXPECT_TRUE(typeid(cloned) == typeid(Class)) << typeid(cloned).name();
  EXPECT_EQ(clone->Code(), code);
  EXPECT_EQ(clone->what(), text);

  EXPECT_THROW_WHAT(clone->Throw(), Class, text);
  EXPECT_THROW(clone->Throw(), Exception);
  EXPECT_THROW(clone->Throw(), std::exception);
}

}  // namespace testsupport

#endif  // UNIT_CHECK_EXCEPTION_H
