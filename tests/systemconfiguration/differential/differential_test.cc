#include <gtest/gtest.h>

#include <functional>
#include <sstream>
#include <stdexcept>
#include <string>

#include "systemconfiguration/differential/input_generator.h"
#include "systemconfiguration/differential/nss_comparison.h"
#include "systemconfiguration/differential/pam_comparison.h"
#include "systemconfiguration/reference/pam_reference.h"

namespace differential {
namespace {

constexpr int inputs = 100'000;
constexpr std::uint64_t seed = 20261121;

using Comparison = std::function<std::string(const InputCase&)>;

void ExpectNoDifference(InputGenerator::Format format, const Comparison& compare) {
  InputGenerator generator(format, seed);
  for (int number = 0; number < inputs; ++number) {
    const InputCase input = generator.Next();
    const std::string difference = compare(input);
    ASSERT_EQ(difference, "") << "input " << number << ": " << input;
  }
}

TEST(PAMDifferentialTest, LibraryAndReferenceAgreeOnFacilities) {
  ExpectNoDifference(InputGenerator::Format::PamPolicy, CompareFacility);
}

TEST(PAMDifferentialTest, LibraryAndReferenceAgreeOnEntries) {
  ExpectNoDifference(InputGenerator::Format::PamEntry, CompareEntry);
}

TEST(PAMDifferentialTest, LibraryAndReferenceAgreeOnPolicies) {
  ExpectNoDifference(InputGenerator::Format::PamPolicy, ComparePolicy);
}

TEST(PAMDifferentialTest, AWrittenPolicyIsReadAsTheSamePolicy) {
  ExpectNoDifference(InputGenerator::Format::PamPolicy, ComparePolicyWithItsRoundTrip);
}

TEST(NSSDifferentialTest, LibraryAndReferenceAgreeOnConfigurations) {
  ExpectNoDifference(InputGenerator::Format::NameServiceSwitch, CompareConfiguration);
}

TEST(NSSDifferentialTest, AWrittenConfigurationIsReadAsTheSameConfiguration) {
  ExpectNoDifference(InputGenerator::Format::NameServiceSwitch, CompareConfigurationWithItsRoundTrip);
}

// Were most inputs refused at their first word, agreeing on them would say little.
TEST(InputGeneratorTest, OneInFiveInputsIsAPolicyWithoutFault) {
  InputGenerator generator(InputGenerator::Format::PamPolicy, seed);
  int readable = 0;
  for (int number = 0; number < 1000; ++number) {
    std::istringstream text(generator.Next().text);
    reference::PamPolicy policy;
    try {
      reference::ReadPolicy(text, policy);
    } catch (const std::runtime_error&) {
      continue;
    }
    if (!policy.stacks.empty()) ++readable;
  }
  EXPECT_GE(readable, 200);
}

}  // namespace
}  // namespace differential
