// How each operation of the provider calls its slot, and what becomes of what it returns.

#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <deque>
#include <functional>
#include <string>
#include <utility>
#include <vector>

#include "authentication/authentication.h"
#include "plugins/scripted_plugin.h"
#include "providers/active_directory_provider.h"
#include "support/expect_throw_what.h"

namespace quenix::authentication {
namespace {

using testsupport::Answer;
using testsupport::ListOf;
using testsupport::NamePair;
using testsupport::Released;

using Names = std::vector<std::string>;

const std::string NOT_IMPLEMENTED = "Exception 0x00000078: This function is not supported on this system.";
const std::string REFUSED = "Exception 0x00000005: Access is denied.";

/// Not to be called: what an operation leaves in its out-parameters when it fails is nobody's.
void MustNotBeReleased(void*) {
  std::abort();
}

class ProviderOperationsTest : public ::testing::Test {
 protected:
  testsupport::Script& script_ = testsupport::UseScriptedPlugin();
  const ActiveDirectoryProvider provider_{"scripted"};
};

TEST_F(ProviderOperationsTest, LeavingWithoutAccountPassesNull) {
  const Credentials credentials{"u", "p"};
  const Credentials* passed = &credentials;
  script_.partDomain = [&](const Credentials* argument) {
    passed = argument;
    return 0U;
  };
  provider_.PartDomain();
  EXPECT_EQ(passed, nullptr);
}

TEST_F(ProviderOperationsTest, LeavingWithAnAccountPassesTheCallersRecord) {
  const Credentials credentials{"u", "p"};
  const Credentials* passed = nullptr;
  script_.partDomain = [&](const Credentials* argument) {
    passed = argument;
    return 0U;
  };
  provider_.PartDomain(credentials);
  EXPECT_EQ(passed, &credentials);
}

TEST_F(ProviderOperationsTest, TheActiveDomainStartsWithNullNames) {
  bool null = false;
  script_.getActiveDomain = [&](ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
    null = domain->dnsName == nullptr && domain->netbiosName == nullptr;
    return Answer(domain, release, {"example.test", "EXAMPLE"});
  };
  const Domain domain = provider_.GetActiveDomain();
  EXPECT_TRUE(null);
  EXPECT_EQ(domain.dnsName, "example.test");
  EXPECT_EQ(domain.netbiosName, "EXAMPLE");
}

TEST_F(ProviderOperationsTest, BothNamesOfTheActiveDomainAreReleasedOnce) {
  std::vector<void*> returned;
  script_.getActiveDomain = [&](ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
    Answer(domain, release, {"example.test", "EXAMPLE"});
    returned = {domain->dnsName, domain->netbiosName};
    return 0U;
  };
  provider_.GetActiveDomain();
  std::vector<void*> released = Released();
  std::sort(released.begin(), released.end());
  std::sort(returned.begin(), returned.end());
  EXPECT_EQ(released, returned);
}

TEST_F(ProviderOperationsTest, ANullNameOfTheActiveDomainIsEmptyAndNotReleased) {
  void* returned = nullptr;
  script_.getActiveDomain = [&](ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
    returned = domain->netbiosName = strdup("EXAMPLE");
    *release = testsupport::ReleaseString;
    return 0U;
  };
  const Domain domain = provider_.GetActiveDomain();
  EXPECT_EQ(domain.dnsName, "");
  EXPECT_EQ(domain.netbiosName, "EXAMPLE");
  EXPECT_EQ(Released(), (std::vector<void*>{returned}));
}

TEST_F(ProviderOperationsTest, AnActiveDomainOfTwoNullNamesIsEmpty) {
  script_.getActiveDomain = [](ActiveDirectoryDomainPair*, ActiveDirectoryFree* release) {
    *release = MustNotBeReleased;
    return 0U;
  };
  const Domain domain = provider_.GetActiveDomain();
  EXPECT_EQ(domain.dnsName + domain.netbiosName, "");
}

TEST_F(ProviderOperationsTest, PreferredControllersArePassedInOrder) {
  Names passed;
  script_.setPreferredDomainControllers = [&](const char* const* names) {
    passed = ListOf(names);
    return 0U;
  };
  provider_.SetPreferredDomainControllers({"dc2", "dc1", ""});
  EXPECT_EQ(passed, (Names{"dc2", "dc1", ""}));
}

TEST_F(ProviderOperationsTest, ListsArePassedAsTheCallersText) {
  const std::deque<std::string> controllers{"dc1"};
  const std::vector<std::string> services{"sshd"};
  const char* controller = nullptr;
  const char* service = nullptr;
  script_.setPreferredDomainControllers = [&](const char* const* names) {
    controller = names[0];
    return 0U;
  };
  script_.setSmartCardEnabledServices = [&](const char* const* names) {
    service = names[0];
    return 0U;
  };
  provider_.SetPreferredDomainControllers(controllers);
  provider_.SetSmartCardEnabledServices(services);
  EXPECT_EQ(controller, controllers[0].c_str());
  EXPECT_EQ(service, services[0].c_str());
}

TEST_F(ProviderOperationsTest, EmptyListsArePassedAsATerminatorAlone) {
  int lengths = 0;
  const auto count = [&](const char* const* names) {
    lengths += names[0] == nullptr ? 1 : 100;
    return 0U;
  };
  script_.setPreferredDomainControllers = count;
  script_.setSmartCardEnabledServices = count;
  provider_.SetPreferredDomainControllers({});
  provider_.SetSmartCardEnabledServices({});
  EXPECT_EQ(lengths, 2);
}

TEST_F(ProviderOperationsTest, SmartCardServicesArePassedInOrder) {
  Names passed;
  script_.setSmartCardEnabledServices = [&](const char* const* names) {
    passed = ListOf(names);
    return 0U;
  };
  provider_.SetSmartCardEnabledServices({"login", "sshd"});
  EXPECT_EQ(passed, (Names{"login", "sshd"}));
}

TEST_F(ProviderOperationsTest, ArraysAreReadUpToTheirTerminatorAndReleasedOnce) {
  void* returned = nullptr;
  script_.getPreferredDomainControllers = [&](char*** names, ActiveDirectoryFree* release) {
    Answer(names, release, Names{"dc2", "dc1"});
    returned = *names;
    return 0U;
  };
  EXPECT_EQ(provider_.GetPreferredDomainControllers(), (std::deque<std::string>{"dc2", "dc1"}));
  EXPECT_EQ(Released(), (std::vector<void*>{returned}));
}

TEST_F(ProviderOperationsTest, ANullArrayIsAnEmptyListAndReleasedOnce) {
  const auto answerNull = [](auto*** array, ActiveDirectoryFree* release) {
    *array = nullptr;
    *release = testsupport::ReleaseStrings;
    return 0U;
  };
  script_.getPreferredDomainControllers = answerNull;
  script_.getSmartCardEnabledServices = answerNull;
  script_.getTrustedDomains = answerNull;
  EXPECT_TRUE(provider_.GetPreferredDomainControllers().empty());
  EXPECT_TRUE(provider_.GetSmartCardEnabledServices().empty());
  EXPECT_TRUE(provider_.GetTrustedDomains().empty());
  EXPECT_EQ(Released(), (std::vector<void*>{nullptr, nullptr, nullptr}));
}

TEST_F(ProviderOperationsTest, SmartCardServicesAreReadInOrderAndReleasedOnce) {
  script_.getSmartCardEnabledServices = [](char*** names, ActiveDirectoryFree* release) {
    return Answer(names, release, Names{"login", "sshd"});
  };
  EXPECT_EQ(provider_.GetSmartCardEnabledServices(), (Names{"login", "sshd"}));
  EXPECT_EQ(Released().size(), 1U);
}

TEST_F(ProviderOperationsTest, TrustedDomainsAreReadInOrderAndTheArrayIsReleasedOnce) {
  void* returned = nullptr;
  script_.getTrustedDomains = [&](ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
    Answer(domains, release, std::vector<NamePair>{{"b.test", "B"}, {"a.test", "A"}});
    returned = *domains;
    return 0U;
  };
  const std::deque<Domain> domains = provider_.GetTrustedDomains();
  ASSERT_EQ(domains.size(), 2U);
  EXPECT_EQ(domains[0].dnsName, "b.test");
  EXPECT_EQ(domains[0].netbiosName, "B");
  EXPECT_EQ(domains[1].dnsName, "a.test");
  EXPECT_EQ(Released(), (std::vector<void*>{returned}));
}

TEST_F(ProviderOperationsTest, TheTrustStateIsReturnedAsItIs) {
  for (const std::uint32_t value : {0U, 1U, 2U, 7U, 1326U, 0xffffffffU}) {
    script_.getDomainTrustState = [value] { return static_cast<TrustState>(value); };
    EXPECT_EQ(static_cast<std::uint32_t>(provider_.GetDomainTrustState()), value);
  }
}

TEST_F(ProviderOperationsTest, TheTrustRelationshipIsReturnedAsItIs) {
  std::string asked;
  script_.getDomainTrustRelationship = [&](const char* domain) {
    asked = domain;
    return static_cast<TrustRelationship>(0xfffffffeU);
  };
  EXPECT_EQ(static_cast<std::uint32_t>(provider_.GetDomainTrustRelationship("other.test")), 0xfffffffeU);
  EXPECT_EQ(asked, "other.test");
}

/// The operations that return one string, and the slots that they call.
struct StringOperation {
  const char* name;
  std::function<std::string(const ActiveDirectoryProvider&)> call;
  std::function<void(testsupport::Script&, std::function<std::uint32_t(char**, ActiveDirectoryFree*)>)>
      script;
};

const StringOperation STRING_OPERATIONS[] = {
    {"MachineAccountDN", [](const auto& provider) { return provider.GetMachineAccountDN(); },
     [](auto& script, auto answer) { script.getMachineAccountDN = answer; }},
    {"AnyDomainController", [](const auto& provider) { return provider.GetAnyDomainController("q", "d"); },
     [](auto& script, auto answer) {
       script.getAnyDomainController = [answer](const char*, const char*, char** text, auto* release) {
         return answer(text, release);
       };
     }},
    {"CanonicalUsername", [](const auto& provider) { return provider.ConvertCanonicalUsername("n"); },
     [](auto& script, auto answer) {
       script.convertCanonicalUsername = [answer](const char*, char** text, auto* release) {
         return answer(text, release);
       };
     }},
    {"HostPrincipal", [](const auto& provider) { return provider.GetHostPrincipalForDomain("d"); },
     [](auto& script, auto answer) {
       script.getHostPrincipalForDomain = [answer](const char*, char** text, auto* release) {
         return answer(text, release);
       };
     }},
};

class StringOperationTest : public ProviderOperationsTest,
                            public ::testing::WithParamInterface<StringOperation> {};

TEST_P(StringOperationTest, ItsTextIsCopiedAndReleasedOnce) {
  void* returned = nullptr;
  GetParam().script(script_, [&](char** text, ActiveDirectoryFree* release) {
    Answer(text, release, "the answer");
    returned = *text;
    return 0U;
  });
  EXPECT_EQ(GetParam().call(provider_), "the answer");
  EXPECT_EQ(Released(), (std::vector<void*>{returned}));
}

TEST_P(StringOperationTest, NullIsTheEmptyStringAndReleasedOnce) {
  GetParam().script(script_, [](char** text, ActiveDirectoryFree* release) {
    *text = nullptr;
    *release = testsupport::ReleaseString;
    return 0U;
  });
  EXPECT_EQ(GetParam().call(provider_), "");
  EXPECT_EQ(Released(), (std::vector<void*>{nullptr}));
}

TEST_P(StringOperationTest, NothingIsReleasedWhenItFails) {
  static char leftover[] = "leftover";
  GetParam().script(script_, [](char** text, ActiveDirectoryFree* release) {
    *text = leftover;
    *release = MustNotBeReleased;
    return 5U;
  });
  EXPECT_THROW_WHAT(GetParam().call(provider_), AccessDeniedException, REFUSED);
}

TEST_P(StringOperationTest, ItsSlotIsCalledOnce) {
  int calls = 0;
  GetParam().script(script_, [&](char**, ActiveDirectoryFree*) {
    ++calls;
    return 1326U;
  });
  EXPECT_THROW(GetParam().call(provider_), LogonFailureException);
  EXPECT_EQ(calls, 1);
}

INSTANTIATE_TEST_SUITE_P(Operations, StringOperationTest, ::testing::ValuesIn(STRING_OPERATIONS),
                         [](const auto& operation) { return std::string(operation.param.name); });

TEST_F(ProviderOperationsTest, AnEmptyQualifierIsPassedAsNull) {
  const char* passed = "";
  std::string domain;
  script_.getAnyDomainController = [&](const char* qualifier, const char* name, char** text, auto* release) {
    passed = qualifier;
    domain = name;
    return Answer(text, release, "dc");
  };
  provider_.GetAnyDomainController("", "example.test");
  EXPECT_EQ(passed, nullptr);
  EXPECT_EQ(domain, "example.test");
}

TEST_F(ProviderOperationsTest, AQualifierAndAnEmptyDomainArePassedAsTheyStand) {
  std::string passed;
  const char* domain = nullptr;
  bool empty = false;
  script_.getAnyDomainController = [&](const char* qualifier, const char* name, char** text, auto* release) {
    passed = qualifier;
    domain = name;
    empty = name != nullptr && *name == '\0';
    return Answer(text, release, "dc");
  };
  provider_.GetAnyDomainController("site", "");
  EXPECT_EQ(passed, "site");
  EXPECT_NE(domain, nullptr);
  EXPECT_TRUE(empty);
}

TEST_F(ProviderOperationsTest, NamesArePassedAsTheyStand) {
  Names passed;
  const auto note = [&](const char* argument, char** text, ActiveDirectoryFree* release) {
    passed.push_back(argument);
    return Answer(text, release, "");
  };
  script_.convertCanonicalUsername = note;
  script_.getHostPrincipalForDomain = note;
  provider_.ConvertCanonicalUsername("DOMAIN\\user name");
  provider_.GetHostPrincipalForDomain("example.test");
  EXPECT_EQ(passed, (Names{"DOMAIN\\user name", "example.test"}));
}

TEST_F(ProviderOperationsTest, NothingIsReleasedWhenAnArrayOrADomainFails) {
  static char name[] = "leftover";
  const auto fail = [](auto*** array, ActiveDirectoryFree* release) {
    *array = reinterpret_cast<std::remove_reference_t<decltype(*array)>>(name);
    *release = MustNotBeReleased;
    return 5U;
  };
  script_.getPreferredDomainControllers = fail;
  script_.getSmartCardEnabledServices = fail;
  script_.getTrustedDomains = fail;
  script_.getActiveDomain = [](ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
    domain->dnsName = name;
    *release = MustNotBeReleased;
    return 5U;
  };
  EXPECT_THROW_WHAT(provider_.GetPreferredDomainControllers(), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.GetSmartCardEnabledServices(), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.GetTrustedDomains(), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.GetActiveDomain(), AccessDeniedException, REFUSED);
}

TEST_F(ProviderOperationsTest, WithoutAFreeFunctionNothingIsReleased) {
  static char text[] = "text";
  static char* texts[] = {text, nullptr};
  script_.getMachineAccountDN = [](char** answer, ActiveDirectoryFree*) {
    *answer = text;
    return 0U;
  };
  script_.getActiveDomain = [](ActiveDirectoryDomainPair* domain, ActiveDirectoryFree*) {
    domain->dnsName = text;
    return 0U;
  };
  script_.getSmartCardEnabledServices = [](char*** names, ActiveDirectoryFree*) {
    *names = texts;
    return 0U;
  };
  EXPECT_EQ(provider_.GetMachineAccountDN(), "text");
  EXPECT_EQ(provider_.GetActiveDomain().dnsName, "text");
  EXPECT_EQ(provider_.GetSmartCardEnabledServices(), (Names{"text"}));
}

TEST_F(ProviderOperationsTest, AStatusOfAnOperationWithoutResultIsThrown) {
  const auto refuse = [](auto...) { return 5U; };
  script_.partDomain = refuse;
  script_.setPreferredDomainControllers = refuse;
  script_.setSmartCardEnabledServices = refuse;
  EXPECT_THROW_WHAT(provider_.PartDomain(), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.PartDomain(Credentials{"u", "p"}), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.SetPreferredDomainControllers({"dc"}), AccessDeniedException, REFUSED);
  EXPECT_THROW_WHAT(provider_.SetSmartCardEnabledServices({"login"}), AccessDeniedException, REFUSED);
}

TEST_F(ProviderOperationsTest, OperationsOtherThanJoinsAreNotRepeated) {
  int calls = 0;
  script_.partDomain = [&](auto...) {
    ++calls;
    return 1326U;
  };
  EXPECT_THROW(provider_.PartDomain(), LogonFailureException);
  EXPECT_EQ(calls, 1);
}

TEST(ProviderWithoutOperationsTest, EveryNullSlotIsNotImplemented) {
  testsupport::InstallPlugin("null_slots");
  const ActiveDirectoryProvider provider("null_slots");
  const Credentials credentials{"u", "p"};
  const std::vector<std::function<void()>> operations{
      [&] { provider.JoinDomain("d", "", credentials); },
      [&] { provider.JoinDomainWithMachineAccount({}, {}); },
      [&] { provider.PartDomain(); },
      [&] { provider.PartDomain(credentials); },
      [&] { provider.GetActiveDomain(); },
      [&] { provider.SetPreferredDomainControllers({}); },
      [&] { provider.GetPreferredDomainControllers(); },
      [&] { provider.GetDomainTrustState(); },
      [&] { provider.GetTrustedDomains(); },
      [&] { provider.GetMachineAccountDN(); },
      [&] { provider.GetAnyDomainController("", "d"); },
      [&] { provider.ConvertCanonicalUsername("n"); },
      [&] { provider.GetHostPrincipalForDomain("d"); },
      [&] { provider.GetDomainTrustRelationship("d"); },
      [&] { provider.SetSmartCardEnabledServices({}); },
      [&] { provider.GetSmartCardEnabledServices(); },
  };
  for (std::size_t index = 0; index < operations.size(); ++index) {
    EXPECT_THROW_WHAT(operations[index](), CallNotImplementedException, NOT_IMPLEMENTED) << index;
  }
}

// The plug-in ends the process when one of these slots is called.
TEST(VersionGateTest, AFilledSlotOfAnOldTableIsNotImplemented) {
  testsupport::InstallPlugin("old_table");
  const ActiveDirectoryProvider provider("old_table");
  EXPECT_THROW_WHAT(provider.JoinDomainWithMachineAccount({}, {}), CallNotImplementedException,
                    NOT_IMPLEMENTED);
  EXPECT_THROW_WHAT(provider.GetHostPrincipalForDomain("d"), CallNotImplementedException, NOT_IMPLEMENTED);
}

TEST(VersionGateTest, ATableOfVersionTwoIsEnoughWhateverTheMetadataSays) {
  testsupport::InstallPlugin("old_metadata");
  const ActiveDirectoryProvider provider("old_metadata");
  EXPECT_EQ(provider.GetHostPrincipalForDomain("d"), "HOST$@EXAMPLE.TEST");
  EXPECT_THROW_WHAT(provider.JoinDomainWithMachineAccount({}, {}), AccessDeniedException, REFUSED);
}

TEST(VersionGateTest, TheLastThreeSlotsAreReadWhateverTheVersion) {
  testsupport::InstallPlugin("late_slots");
  const ActiveDirectoryProvider provider("late_slots");
  EXPECT_EQ(provider.GetDomainTrustRelationship("d"), TRUST_RELATIONSHIP_OUTBOUND);
  EXPECT_THROW(provider.SetSmartCardEnabledServices({}), AccessDeniedException);
  EXPECT_THROW(provider.GetSmartCardEnabledServices(), InvalidPasswordException);
}

}  // namespace
}  // namespace quenix::authentication
