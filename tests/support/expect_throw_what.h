/// EXPECT_THROW_WHAT: the exact class and the exact text of what a statement throws.
#ifndef SUPPORT_EXPECT_THROW_WHAT_H
#define SUPPORT_EXPECT_THROW_WHAT_H

#include <gtest/gtest.h>

#include <exception>
#include <string>
#include <typeinfo>

namespace testsupport {

/// Runs `statement`; succeeds when it throws an object whose class is Expected itself, not one derived from
/// it, and whose what() is `text`.
template <class Expected, class Statement>
::testing::AssertionResult ThrowsWhat(const Statement& statement, const std::string& text) {
  try {
    statement();
  } catch (const Expected& thrown) {
    if (typeid(thrown) != typeid(Expected)) {
      return ::testing::AssertionFailure() << "threw the derived class " << typeid(thrown).name();
    }
    if (thrown.what() != text) {
      return ::testing::AssertionFailure()
             << "threw with the text\n  " << thrown.what() << "\nnot\n  " << text;
    }
    return ::testing::AssertionSuccess();
  } catch (const std::exception& thrown) {
    return ::testing::AssertionFailure() << "threw " << typeid(thrown).name() << ": " << thrown.what();
  } catch (...) {
    return ::testing::AssertionFailure() << "threw something that is no exception class";
  }
  return ::testing::AssertionFailure() << "threw nothing";
}

}  // namespace testsupport

#define EXPECT_THROW_WHAT(statement, Class, text) \
  EXPECT_TRUE(::testsupport::ThrowsWhat<Class>([&] { static_cast<void>(statement); }, text))
#define ASSERT_THROW_WHAT(statement, Class, text) \
  ASSERT_TRUE(::testsupport::ThrowsWhat<Class>([&] { static_cast<void>(statement); }, text))

#endif  // SUPPORT_EXPECT_THROW_WHAT_H
