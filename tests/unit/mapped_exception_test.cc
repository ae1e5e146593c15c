#include "errors/mapped_exception.h"

#include <gtest/gtest.h>

#include <set>
#include <string>
#include <typeinfo>

#include "authentication/provider_exceptions.h"
#include "support/expect_throw_what.h"
#include "unit/check_exception.h"

namespace quenix::authentication {
namespace {

struct Row {
  unsigned int code;
  const char* hexadecimal;
  const std::type_info& type;
  const char* message;
};

/// For test names and messages.
void PrintTo(const Row& row, std::ostream* stream) {
  *stream << row.code;
}

const Row ROWS[] = {
    {2, "00000002", typeid(FileNotFoundException), "The system cannot find the file specified."},
    {5, "00000005", typeid(AccessDeniedException), "Access is denied."},
    {8, "00000008", typeid(NotEnoughMemoryException), "Not enough memory"},
    {86, "00000056", typeid(InvalidPasswordException), "The specified network password is not correct."},
    {87, "00000057", typeid(InvalidParameterException), "The parameter is incorrect."},
    {120, "00000078", typeid(CallNotImplementedException), "This function is not supported on this system."},
    {267, "0000010b", typeid(DirectoryException), "The directory name is invalid."},
    {609, "00000261", typeid(BadDLLEntryPointException), "Bad DLL entry point."},
    {1002, "000003ea", typeid(InvalidMessageException), "The window cannot act on the sent message."},
    {1060, "00000424", typeid(ServiceDoesNotExistException),
     "The specified service does not exist as an installed service."},
    {1061, "00000425", typeid(ServiceCannotAcceptControlException),
     "The service cannot accept control messages at this time."},
    {1062, "00000426", typeid(ServiceNotActiveException), "The service has not been started."},
    {1064, "00000428", typeid(ExceptionInServiceException),
     "An exception occurred in the service when handling the control request."},
    {1067, "0000042b", typeid(ProcessAbortedException), "The process terminated unexpectedly."},
    {1201, "000004b1", typeid(ConnectionUnavailableException),
     "The device is not currently connected but it is a remembered connection."},
    {1209, "000004b9", typeid(InvalidGroupNameException),
     "The format of the specified group name is invalid."},
    {1210, "000004ba", typeid(InvalidComputerNameException),
     "The format of the specified computer name is invalid."},
    {1212, "000004bc", typeid(InvalidDomainNameException),
     "The format of the specified domain name is invalid."},
    {1213, "000004bd", typeid(InvalidServiceNameException),
     "The format of the specified service name is invalid."},
    {1214, "000004be", typeid(InvalidNetNameException),
     "The format of the specified network name is invalid."},
    {1215, "000004bf", typeid(InvalidShareNameException),
     "The format of the specified share name is invalid."},
    {1216, "000004c0", typeid(InvalidPasswordNameException),
     "The format of the specified password is invalid."},
    {1222, "000004c6", typeid(NoNetworkException), "The network is not present or not started."},
    {1225, "000004c9", typeid(ConnectionRefusedException),
     "The remote computer refused the network connection."},
    {1229, "000004cd", typeid(ConnectionInvalidException),
     "An operation was attempted on a nonexistent network connection."},
    {1311, "0000051f", typeid(NoLogonServersException),
     "There are currently no logon servers available to service the logon request."},
    {1315, "00000523", typeid(InvalidAccountNameException),
     "The name provided is not a properly formed account name."},
    {1317, "00000525", typeid(NoSuchUserException), "The specified account does not exist."},
    {1324, "0000052c", typeid(IllFormedPasswordException),
     "The value provided for the new password contains values that are not allowed in passwords."},
    {1325, "0000052d", typeid(PasswordRestrictionException),
     "The value provided for the new password does not meet the length, complexity, or history requirements "
     "of the "
     "domain."},
    {1326, "0000052e", typeid(LogonFailureException),
     "The attempted logon is invalid. This is due to either a bad user name or authentication information."},
    {1330, "00000532", typeid(PasswordExpiredException),
     "Logon failure: the specified account password has expired."},
    {1331, "00000533", typeid(AccountDisabledException), "Logon failure: account currently disabled."},
    {1355, "0000054b", typeid(NoSuchDomainException),
     "The specified domain either does not exist or could not be contacted."},
    {1359, "0000054f", typeid(InternalErrorException), "An internal error occurred."},
    {1398, "00000576", typeid(TimeSkewException),
     "There is a time and/or date difference between the client and server."},
    {1575, "00000627", typeid(NoSuchGroupException), "The specified group does not exist."},
    {1703, "000006a7", typeid(RPCSProtocolSequenceNotSupportedException),
     "The RPC protocol sequence is not supported."},
    {1786, "000006fa", typeid(NoTrustLSASecretException), "The workstation does not have a trust secret."},
    {1787, "000006fb", typeid(NoTrustSAMAccountException),
     "The domain controller does not have an account for this workstation."},
    {1791, "000006ff", typeid(RPCSCallInProgressException),
     "A remote procedure call is already in progress for this thread."},
    {1810, "00000712", typeid(DomainTrustInconsistentException),
     "The name or security ID (SID) of the domain specified is inconsistent with the trust information for "
     "that "
     "domain."},
    {2138, "0000085a", typeid(WkstaNotStartedException), "The Workstation service has not been started."},
    {2691, "00000a83", typeid(SetupAlreadyJoinedException), "This machine is already joined to a domain."},
    {2695, "00000a87", typeid(InvalidWorkgroupNameException), "The specified workgroup name is invalid."},
    {10060, "0000274c", typeid(WSATimedOutException),
     "A connection attempt failed because the connected party did not properly respond after a period of "
     "time, or "
     "established connection failed because connected host has failed to respond."},
};

class MappedExceptionRowTest : public ::testing::TestWithParam<Row> {};

TEST_P(MappedExceptionRowTest, HasItsClassCodeAndText) {
  const Row& row = GetParam();
  const std::string text = std::string("Exception 0x") + row.hexadecimal + ": " + row.message;
  try {
    ThrowMappedException(row.code);
  } catch (const Exception& exception) {
    EXPECT_TRUE(typeid(exception) == row.type) << typeid(exception).name();
    EXPECT_EQ(exception.Code(), row.code);
    EXPECT_EQ(exception.what(), text);
    const std::unique_ptr<const Exception> clone(exception.Clone());
    const Exception& cloned = *clone;
    EXPECT_TRUE(typeid(cloned) == row.type) << typeid(cloned).name();
    EXPECT_EQ(clone->Code(), row.code);
    EXPECT_EQ(clone->what(), text);
    try {
      clone->Throw();
    } catch (const Exception& thrown) {
      EXPECT_TRUE(typeid(thrown) == row.type) << typeid(thrown).name();
      EXPECT_EQ(thrown.what(), text);
    }
  }
}

INSTANTIATE_TEST_SUITE_P(Codes, MappedExceptionRowTest, ::testing::ValuesIn(ROWS),
                         [](const auto& row) { return std::to_string(row.param.code); });

TEST(MappedExceptionTest, NoTwoRowsHaveTheSameClass) {
  std::set<std::string> names;
  for (const Row& row : ROWS) {
    names.insert(row.type.name());
  }
  EXPECT_EQ(names.size(), 46U);
}

TEST(MappedExceptionTest, CodeZeroIsAMissingFileWithCodeTwo) {
  try {
    ThrowMappedException(0);
  } catch (const FileNotFoundException& exception) {
    testsupport::CheckException(exception, 2,
                                "Exception 0x00000002: The system cannot find the file specified.");
    return;
  }
  FAIL();
}

TEST(MappedExceptionTest, EveryOtherCodeUpToTwentyThousandIsUnknown) {
  std::set<unsigned int> known{0};
  for (const Row& row : ROWS) {
    known.insert(row.code);
  }
  for (unsigned int code = 0; code < 20000; ++code) {
    if (known.count(code) != 0) {
      continue;
    }
    try {
      ThrowMappedException(code);
    } catch (const Exception& exception) {
      ASSERT_TRUE(typeid(exception) == typeid(UnknownException)) << code;
      ASSERT_EQ(exception.Code(), code);
    }
  }
}

TEST(MappedExceptionTest, AGapInARunOfNumbersIsUnknown) {
  EXPECT_THROW_WHAT(ThrowMappedException(1063), UnknownException, "Exception 0x00000427: Unknown exception");
}

TEST(MappedExceptionTest, TheTwoHighCodesAreUnknownWithThatVeryCode) {
  EXPECT_THROW_WHAT(ThrowMappedException(4294901760U), UnknownException,
                    "Exception 0xffff0000: Unknown exception");
  EXPECT_THROW_WHAT(ThrowMappedException(4294901761U), UnknownException,
                    "Exception 0xffff0001: Unknown exception");
}

TEST(MappedExceptionTest, TheHighestCodeIsNotSignExtended) {
  EXPECT_THROW_WHAT(ThrowMappedException(4294967295U), UnknownException,
                    "Exception 0xffffffff: Unknown exception");
}

}  // namespace
}  // namespace quenix::authentication
