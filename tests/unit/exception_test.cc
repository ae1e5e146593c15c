#include <gtest/gtest.h>

#include <exception>
#include <memory>
#include <string>
#include <thread>
#include <type_traits>
#include <typeinfo>

#include "authentication/authentication.h"
#include "support/expect_throw_what.h"
#include "unit/check_exception.h"

namespace quenix::authentication {
namespace {

using testsupport::CheckException;

TEST(ExceptionTest, AMessageAloneIsTheWholeText) {
  const Exception exception("the message");
  EXPECT_STREQ(exception.what(), "the message");
  EXPECT_EQ(exception.Code(), 0UL);
}

TEST(ExceptionTest, AnEmptyMessageStaysEmpty) {
  const Exception exception("");
  EXPECT_STREQ(exception.what(), "");
  EXPECT_EQ(exception.Code(), 0UL);
}

TEST(ExceptionTest, ACodeIsPutBeforeTheMessage) {
  const Exception exception(120UL, "This function is not supported on this system.");
  EXPECT_STREQ(exception.what(), "Exception 0x00000078: This function is not supported on this system.");
  EXPECT_EQ(exception.Code(), 120UL);
}

TEST(ExceptionTest, CodeZeroIsPrintedToo) {
  EXPECT_STREQ(Exception(0UL, "message").what(), "Exception 0x00000000: message");
}

TEST(ExceptionTest, ACodeIsPrintedInLowerCase) {
  EXPECT_STREQ(Exception(0xABCDEF01UL, "").what(), "Exception 0xabcdef01: ");
}

TEST(ExceptionTest, ACodeOfMoreThanEightDigitsIsPrintedInFull) {
  EXPECT_STREQ(Exception(0x123456789abcUL, "m").what(), "Exception 0x123456789abc: m");
  EXPECT_EQ(Exception(0x123456789abcUL, "m").Code(), 0x123456789abcUL);
}

TEST(ExceptionTest, ACopyHasCodeAndMessage) {
  const Exception original(5UL, "message");
  const Exception copy(original);
  EXPECT_EQ(copy.Code(), 5UL);
  EXPECT_STREQ(copy.what(), "Exception 0x00000005: message");
}

TEST(ExceptionTest, TheTextIsTheSameObjectOnEachCall) {
  const Exception exception("message");
  EXPECT_EQ(exception.what(), exception.what());
}

TEST(ExceptionTest, ThrowOnABaseObjectThrowsThatClassItself) {
  const Exception exception(7UL, "m");
  EXPECT_THROW_WHAT(exception.Throw(), Exception, "Exception 0x00000007: m");
}

TEST(ExceptionTest, ACloneSharesNothingWithItsSource) {
  std::unique_ptr<const Exception> clone;
  {
    const InvalidKeyException source("a key whose text is too long for the inside of a string object");
    clone.reset(source.Clone());
    EXPECT_NE(static_cast<const void*>(clone->what()), source.what());
  }
  EXPECT_STREQ(
      clone->what(),
      "The specified key 'a key whose text is too long for the inside of a string object' was not found in "
      "this configuration");
}

TEST(ExceptionTest, AThrownCopyLeavesItsSourceToItsHolder) {
  const std::unique_ptr<const Exception> kept(InvalidKeyException("k").Clone());
  EXPECT_THROW(kept->Throw(), InvalidKeyException);
  EXPECT_THROW(kept->Throw(), InvalidKeyException);
  EXPECT_STREQ(kept->what(), "The specified key 'k' was not found in this configuration");
}

TEST(ExceptionTest, ACloneIsThrownOnAnotherThreadAsItsOwnClass) {
  std::unique_ptr<Exception> clone;
  try {
    throw InvalidKeyException("k");
  } catch (const Exception& caught) {
    clone.reset(caught.Clone());
  }
  bool sameClass = false;
  std::thread([&clone, &sameClass] {
    try {
      clone->Throw();
    } catch (const InvalidKeyException&) {
      sameClass = true;
    } catch (...) {
    }
  }).join();
  EXPECT_TRUE(sameClass);
}

TEST(ExceptionTest, EverySubclassAddsNoField) {
  EXPECT_EQ(sizeof(InvalidKeyException), sizeof(Exception));
  EXPECT_EQ(sizeof(UnknownException), sizeof(Exception));
  EXPECT_EQ(sizeof(CallNotImplementedException), sizeof(Exception));
}

TEST(ExceptionTest, UnknownExceptionTakesItsCode) {
  CheckException(UnknownException(5UL), 5, "Exception 0x00000005: Unknown exception");
}

TEST(ExceptionTest, ClassesThatCarryACodeHaveItHoweverTheyAreMade) {
  EXPECT_EQ(CallNotImplementedException().Code(), 120UL);
  EXPECT_EQ(FileNotFoundException().Code(), 2UL);
  EXPECT_EQ(NotEnoughMemoryException().Code(), 8UL);
  EXPECT_EQ(ConnectionRefusedException().Code(), 1225UL);
  EXPECT_EQ(ConnectionInvalidException().Code(), 1229UL);
  EXPECT_EQ(WSATimedOutException().Code(), 10060UL);
  EXPECT_EQ(std::string(WSATimedOutException().what()).substr(0, 24), "Exception 0x0000274c: A ");
}

TEST(LibraryExceptionsTest, ProviderCallTimedOut) {
  CheckException(ProviderCallTimedOutException(), 0, "Provider call timed out.");
}

TEST(LibraryExceptionsTest, ThreadError) {
  CheckException(ThreadErrorException("detail"), 0, "Thread Error: detail");
}

TEST(LibraryExceptionsTest, ConfigurationErrorIsItsTextUnchanged) {
  CheckException(ConfigurationError("a %s 'text'"), 0, "a %s 'text'");
}

TEST(LibraryExceptionsTest, IOErrorIsItsTextUnchanged) {
  CheckException(IOError("a text"), 0, "a text");
}

TEST(LibraryExceptionsTest, FilePermissionErrorIsItsTextUnchanged) {
  CheckException(FilePermissionError("a text"), 0, "a text");
}

TEST(LibraryExceptionsTest, InvalidKey) {
  CheckException(InvalidKeyException("the key"), 0,
                 "The specified key 'the key' was not found in this configuration");
}

TEST(LibraryExceptionsTest, TheArgumentIsNeitherQuotedNorEscaped) {
  CheckException(InvalidKeyException("a'b\"%s\n"), 0,
                 "The specified key 'a'b\"%s\n' was not found in this configuration");
}

TEST(LibraryExceptionsTest, UnknownRemoteAuthenticationStore) {
  CheckException(UnknownRemoteAuthenticationStoreException("X"), 0, "The specified store 'X' is unknown");
}

TEST(LibraryExceptionsTest, InvalidRemoteAuthenticationStore) {
  CheckException(InvalidRemoteAuthenticationStoreException("X"), 0, "The specified store 'X' is invalid");
}

TEST(LibraryExceptionsTest, InvalidActiveDirectoryProvider) {
  CheckException(InvalidActiveDirectoryProviderException("X"), 0,
                 "The specified Active Directory provider 'X' is invalid");
}

TEST(LibraryExceptionsTest, InvalidActiveDirectoryProviderWithReason) {
  CheckException(InvalidActiveDirectoryProviderException("X", "why"), 0,
                 "The specified Active Directory provider 'X' is invalid: why");
}

TEST(LibraryExceptionsTest, InvalidCAMProxyProvider) {
  CheckException(InvalidCAMProxyProviderException("X"), 0, "The specified CAMProxy provider 'X' is invalid");
}

TEST(LibraryExceptionsTest, InvalidCAMProxyProviderWithReason) {
  CheckException(InvalidCAMProxyProviderException("X", "why"), 0,
                 "The specified CAMProxy provider 'X' is invalid: why");
}

TEST(LibraryExceptionsTest, InvalidThumbprintStore) {
  CheckException(InvalidThumbprintStoreException("X"), 0, "The specified thumbprint store 'X' is invalid");
}

TEST(LibraryExceptionsTest, InvalidHostName) {
  CheckException(InvalidHostNameException("X"), 0, "The current hostname is invalid: X");
}

TEST(LibraryExceptionsTest, InvalidCredentials) {
  CheckException(InvalidCredentialsException("X"), 0, "The credentials that were provided were invalid: X");
}

TEST(LibraryExceptionsTest, InvalidIPAddress) {
  CheckException(InvalidIPAddressException("X"), 0, "The IP Address is invalid: X");
}

TEST(LibraryExceptionsTest, InvalidVerifyCAMCertificateOption) {
  CheckException(InvalidVerifyCAMCertificateOptionException("X"), 0,
                 "The VerifyCAMCertificate option is invalid: X");
}

TEST(LibraryExceptionsTest, InvalidCertificate) {
  CheckException(InvalidCertificateException(), 0,
                 "The certificate format is invalid; only PEM format is supported.");
}

TEST(LibraryExceptionsTest, InvalidCAMCertificate) {
  CheckException(InvalidCAMCertificateException(), 0, "The CAM server's certificate cannot be verified.");
}

}  // namespace
}  // namespace quenix::authentication
