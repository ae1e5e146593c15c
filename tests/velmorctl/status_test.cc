#include <gtest/gtest.h>

#include <chrono>

#include "prepared_host.h"

namespace velmorctltest {

namespace {

class StatusTest : public PreparedHost {
 protected:
  /// A joined host whose provider has an answer to everything.
  static void MakeComplete() {
    MakeJoined();
    Script("machineAccountDN", "CN=SANDBOX,OU=Servers,DC=corp,DC=example\n");
    Script("controller", "dc1.corp.example\n");
    Script("preferred", "dc2.corp.example\ndc3.corp.example\n");
    Script("trusted", "other.example OTHER\nthird.example THIRD\n");
    Script("relationship.third.example", "4");
  }

  static std::chrono::duration<double> Duration(const std::vector<std::string>& arguments, Outcome& outcome) {
    const auto start = std::chrono::steady_clock::now();
    outcome = Velmorctl(arguments);
    return std::chrono::steady_clock::now() - start;
  }
};

TEST_F(StatusTest, ShowsEverythingAsJson) {
  MakeComplete();
  const Outcome outcome = Velmorctl({"status", "--json"});
  EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
  EXPECT_EQ(outcome.Json(), nlohmann::json::parse(R"({
    "schema": "velmor.status/1",
    "store": "Active Directory",
    "provider": "ctlscript",
    "providerProblem": null,
    "joined": true,
    "recordedDomain": "corp.example",
    "domain": {
      "dnsName": "corp.example",
      "netbiosName": "SCRIPTED",
      "organizationalUnit": "Servers",
      "machineAccountDN": "CN=SANDBOX,OU=Servers,DC=corp,DC=example",
      "domainController": "dc1.corp.example",
      "preferredDomainControllers": ["dc2.corp.example", "dc3.corp.example"],
      "trustState": "healthy",
      "trustStateLive": true,
      "trustedDomains": [
        {"dnsName": "other.example", "netbiosName": "OTHER", "relationship": "two-way", "live": true},
        {"dnsName": "third.example", "netbiosName": "THIRD", "relationship": "inbound", "live": true}
      ],
      "trustedDomainsLive": true,
      "failures": []
    },
    "live": true
  })"));
}

TEST_F(StatusTest, ShowsEverythingAsATable) {
  MakeComplete();
  EXPECT_EQ(Velmorctl({"status"}).output,
            "Store:                  Active Directory\n"
            "Provider:               ctlscript\n"
            "Domain:                 corp.example (SCRIPTED)\n"
            "Organizational unit:    Servers\n"
            "Machine account:        CN=SANDBOX,OU=Servers,DC=corp,DC=example\n"
            "Domain controller:      dc1.corp.example\n"
            "Preferred controllers:  dc2.corp.example, dc3.corp.example\n"
            "Trust state:            healthy\n"
            "Answers:                live\n"
            "\n"
            "Trusted domain  NetBIOS name  Relationship\n"
            "other.example   OTHER         two-way\n"
            "third.example   THIRD         inbound\n");
}

TEST_F(StatusTest, PrintsNoControlCharacters) {
  MakeComplete();
  Script("controller", "dc1\x1b[2Jcorp\n");
  EXPECT_NE(Velmorctl({"status"}).output.find("dc1?[2Jcorp"), std::string::npos);
}

TEST_F(StatusTest, PrintsAValidDocumentForBytesThatAreNotText) {
  MakeComplete();
  Script("controller", "dc1\xff\n");
  EXPECT_EQ(Velmorctl({"status", "--json"}).Json()["domain"]["domainController"], "dc1\uFFFD");
}

TEST_F(StatusTest, IsThreeForAHostThatHasJoinedNothing) {
  const Outcome outcome = Velmorctl({"status", "--json"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_EQ(outcome.Json()["joined"], false);
}

TEST_F(StatusTest, NeedsNoProviderWhileTheStoreIsNone) {
  testsupport::RemoveFile(testsupport::PROVIDER_CONF);
  const Outcome outcome = Velmorctl({"status", "--json"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_TRUE(outcome.Json()["provider"].is_null());
}

TEST_F(StatusTest, IsNineForAJoinedHostWhoseProviderIsGone) {
  MakeComplete();
  testsupport::RemoveFile(testsupport::PLUGIN_FOLDER + "libctlscript.so");
  EXPECT_EQ(Velmorctl({"status"}).exitCode, 9);
}

TEST_F(StatusTest, SaysThatAJoinedHostUsesTheStoreNone) {
  MakeComplete();
  testsupport::WriteFile(testsupport::AUTHENTICATION_CONF, "remote-authentication-store = \"None\"\n");
  EXPECT_NE(Velmorctl({"status"}).output.find("users of the domain are not authenticated"),
            std::string::npos);
}

TEST_F(StatusTest, ShowsTheRecordedDomainWhenTheProviderNamesNone) {
  MakeComplete();
  Script("status.getActiveDomain", "1062");
  Script("trustState", "8");
  const Outcome outcome = Velmorctl({"status", "--json"});
  EXPECT_EQ(outcome.exitCode, 7);
  EXPECT_EQ(outcome.Json()["domain"]["dnsName"], "corp.example");
}

TEST_F(StatusTest, IsThreeWhenOnlyTheRecordSaysThatTheHostIsJoined) {
  MakeComplete();
  RemoveScript("domain");
  Script("trustState", "9");
  const Outcome outcome = Velmorctl({"status"});
  EXPECT_EQ(outcome.exitCode, 3);
  EXPECT_NE(outcome.output.find("velmorctl leave"), std::string::npos) << outcome.output;
}

TEST_F(StatusTest, IsFiveAndMarksTheAnswerWhenTheTrustStateIsLate) {
  MakeComplete();
  Script("hang.getDomainTrustState", "");
  const Outcome outcome = Velmorctl({"status", "--json", "--timeout", "1"});
  EXPECT_EQ(outcome.exitCode, 5);
  const nlohmann::json document = outcome.Json();
  EXPECT_EQ(document["live"], false);
  EXPECT_EQ(document["domain"]["trustState"], "timed-out");
  EXPECT_EQ(document["domain"]["trustStateLive"], false);
  EXPECT_EQ(document["domain"]["trustedDomainsLive"], true);
}

TEST_F(StatusTest, MarksOneRelationshipThatIsLate) {
  MakeComplete();
  Script("hang.getDomainTrustRelationship", "");
  const Outcome outcome = Velmorctl({"status", "--json", "--timeout", "1"});
  EXPECT_EQ(outcome.exitCode, 5);
  const nlohmann::json trusted = outcome.Json()["domain"]["trustedDomains"];
  EXPECT_EQ(trusted[0]["relationship"], "unknown");
  EXPECT_EQ(trusted[0]["live"], false);
  EXPECT_EQ(outcome.Json()["domain"]["trustStateLive"], true);
}

TEST_F(StatusTest, ShowsTheRecordedDomainWhenTheProviderDoesNotAnswer) {
  MakeComplete();
  for (const char* operation :
       {"getActiveDomain", "getTrustedDomains", "getDomainTrustState", "getAnyDomainController"}) {
    Script(std::string("hang.") + operation, "");
  }
  const Outcome outcome = Velmorctl({"status", "--json", "--timeout", "1"});
  EXPECT_EQ(outcome.exitCode, 5);
  EXPECT_EQ(outcome.Json()["domain"]["dnsName"], "corp.example");
  EXPECT_TRUE(outcome.Json()["domain"]["domainController"].is_null());
}

TEST_F(StatusTest, EndsAtOnceAndCleanlyWhileAnOperationHangs) {
  MakeComplete();
  Script("hang.getDomainTrustState", "");
  Outcome outcome;
  // One second to wait for the answer, and far less than the provider's patience, which has no end.
  EXPECT_LT(Duration({"trust", "show", "--timeout", "1"}, outcome), std::chrono::seconds(15));
  EXPECT_EQ(outcome.exitCode, 5);
  EXPECT_EQ(outcome.errors, "");
}

TEST_F(StatusTest, KnowsALateAnswerThatALaterQuestionShares) {
  MakeComplete();
  Script("hang.getTrustedDomains", "");
  const nlohmann::json domain = Velmorctl({"status", "--json", "--timeout", "1"}).Json()["domain"];
  EXPECT_EQ(domain["trustedDomainsLive"], false);
  // It asks for the trusted domains too, but its own answer came in time.
  EXPECT_EQ(domain["trustStateLive"], true);
  EXPECT_EQ(domain["trustState"], "healthy");
}

TEST_F(StatusTest, ShowsTheRestWhenOneQuestionFails) {
  MakeComplete();
  Script("status.getTrustedDomains", "1311");
  const Outcome outcome = Velmorctl({"status", "--json"});
  EXPECT_EQ(outcome.exitCode, 8);
  const nlohmann::json domain = outcome.Json()["domain"];
  EXPECT_EQ(domain["trustState"], "healthy");
  EXPECT_EQ(domain["domainController"], "dc1.corp.example");
  EXPECT_EQ(domain["failures"][0]["question"], "trusted domains");
}

TEST_F(StatusTest, IsTheTrustsExitCodeWhenAQuestionFailsToo) {
  MakeComplete();
  Script("status.getTrustedDomains", "1062");
  Script("status.getAnyDomainController", "1062");
  Script("trustState", "4");
  const Outcome outcome = Velmorctl({"status"});
  EXPECT_EQ(outcome.exitCode, 4);
  EXPECT_NE(outcome.output.find("Failed:                 domain controller: Exception 0x00000426: "),
            std::string::npos)
      << outcome.output;
}

TEST_F(StatusTest, IsElevenWhenTheRecordCannotBeRead) {
  MakeComplete();
  testsupport::WriteFile("/var/lib/quenix/configstore.db", std::string(4096, 'x'));
  const Outcome outcome = Velmorctl({"status"});
  EXPECT_EQ(outcome.exitCode, 11);
  EXPECT_NE(outcome.errors.find("/var/lib/quenix/configstore.db"), std::string::npos) << outcome.errors;
}

struct TrustCase {
  const char* number;
  const char* name;
  int exitCode;
};

void PrintTo(const TrustCase& testCase, std::ostream* stream) {
  *stream << testCase.name;
}

class TrustStateTest : public StatusTest, public ::testing::WithParamInterface<TrustCase> {};

TEST_P(TrustStateTest, HasANameAndAnExitCode) {
  MakeComplete();
  Script("trustState", GetParam().number);
  const Outcome outcome = Velmorctl({"trust", "show", "--json"});
  EXPECT_EQ(outcome.exitCode, GetParam().exitCode);
  EXPECT_EQ(outcome.Json(), (nlohmann::json{{"schema", "velmor.trust/1"},
                                            {"domain", "corp.example"},
                                            {"state", GetParam().name},
                                            {"stateNumber", std::stoi(GetParam().number)},
                                            {"live", true}}));
}

INSTANTIATE_TEST_SUITE_P(Each, TrustStateTest,
                         ::testing::Values(TrustCase{"1", "healthy", 0},
                                           TrustCase{"3", "account-unusable", 4},
                                           TrustCase{"4", "wrong-password", 4},
                                           TrustCase{"5", "no-domain-controller", 8},
                                           TrustCase{"7", "not-known", 1}, TrustCase{"8", "service-down", 7},
                                           TrustCase{"9", "not-joined", 3}, TrustCase{"10", "broken", 4},
                                           TrustCase{"42", "unnamed (42)", 1}),
                         [](const auto& test) { return std::string("State") + test.param.number; });

class RelationshipTest : public StatusTest, public ::testing::WithParamInterface<TrustCase> {};

TEST_P(RelationshipTest, HasAName) {
  MakeComplete();
  Script("relationship.other.example", GetParam().number);
  const Outcome outcome = Velmorctl({"trust", "show", "other.example", "--json"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.Json(), (nlohmann::json{{"schema", "velmor.trust-relationship/1"},
                                            {"domain", "corp.example"},
                                            {"with", "other.example"},
                                            {"relationship", GetParam().name},
                                            {"relationshipNumber", std::stoi(GetParam().number)},
                                            {"live", true}}));
}

INSTANTIATE_TEST_SUITE_P(Each, RelationshipTest,
                         ::testing::Values(TrustCase{"1", "same-domain", 0}, TrustCase{"3", "two-way", 0},
                                           TrustCase{"4", "inbound", 0}, TrustCase{"5", "outbound", 0},
                                           TrustCase{"6", "unknown", 0}, TrustCase{"8", "none", 0},
                                           TrustCase{"42", "unnamed (42)", 0}),
                         [](const auto& test) { return std::string("Relationship") + test.param.number; });

class TrustTest : public StatusTest {};

TEST_F(TrustTest, ListsTheTrustedDomains) {
  MakeComplete();
  EXPECT_EQ(Velmorctl({"trust", "list"}).output,
            "DOMAIN         NETBIOS NAME  RELATIONSHIP\n"
            "other.example  OTHER         two-way\n"
            "third.example  THIRD         inbound\n");
  EXPECT_EQ(Velmorctl({"trust", "list", "--json"}).Json()["schema"], "velmor.trust-list/1");
}

TEST_F(TrustTest, NeedsAJoinedHost) {
  EXPECT_EQ(Velmorctl({"trust", "show"}).exitCode, 3);
  EXPECT_EQ(Velmorctl({"trust", "list"}).exitCode, 3);
}

TEST_F(TrustTest, ListIsFiveWhenItIsFromTheCache) {
  MakeComplete();
  Script("hang.getTrustedDomains", "");
  const Outcome outcome = Velmorctl({"trust", "list", "--timeout", "1"});
  EXPECT_EQ(outcome.exitCode, 5);
  EXPECT_NE(outcome.output.find("from the cache"), std::string::npos) << outcome.output;
}

TEST_F(TrustTest, PassesTheProvidersFailureOn) {
  MakeComplete();
  Script("status.getTrustedDomains", "1311");
  EXPECT_EQ(Velmorctl({"trust", "list"}).exitCode, 8);
}

class DomainControllerTest : public StatusTest {};

TEST_F(DomainControllerTest, ShowsTheControllerAndThePreferredOnes) {
  MakeComplete();
  const Outcome outcome = Velmorctl({"dc", "show", "--json"});
  EXPECT_EQ(outcome.exitCode, 0);
  EXPECT_EQ(outcome.Json(),
            (nlohmann::json{{"schema", "velmor.dc/1"},
                            {"domain", "corp.example"},
                            {"domainController", "dc1.corp.example"},
                            {"preferredDomainControllers", {"dc2.corp.example", "dc3.corp.example"}},
                            {"live", true}}));
}

TEST_F(DomainControllerTest, IsFiveWhenTheProviderDoesNotAnswer) {
  MakeComplete();
  Script("hang.getAnyDomainController", "");
  const Outcome outcome = Velmorctl({"dc", "show", "--timeout", "1"});
  EXPECT_EQ(outcome.exitCode, 5);
  EXPECT_NE(outcome.output.find("no answer"), std::string::npos) << outcome.output;
}

TEST_F(DomainControllerTest, PrefersTheNamedOnesInTheirOrder) {
  EXPECT_EQ(Velmorctl({"dc", "prefer", "dc9", "dc8"}).exitCode, 0);
  EXPECT_EQ(testsupport::ReadFile("/run/script/preferred"), "dc9\ndc8\n");
}

TEST_F(DomainControllerTest, PrefersNoneOnlyWhenItIsToldSo) {
  Script("preferred", "dc1\n");
  EXPECT_EQ(Velmorctl({"dc", "prefer"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"dc", "prefer", "--none", "dc2"}).exitCode, 2);
  EXPECT_EQ(testsupport::ReadFile("/run/script/preferred"), "dc1\n");
  EXPECT_EQ(Velmorctl({"dc", "prefer", "--none"}).exitCode, 0);
  EXPECT_EQ(testsupport::ReadFile("/run/script/preferred"), "");
}

class SmartCardTest : public StatusTest {};

TEST_F(SmartCardTest, ListsWhatWasSet) {
  EXPECT_EQ(Velmorctl({"smartcard", "set", "login", "sshd"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"smartcard", "list"}).output, "login\nsshd\n");
  EXPECT_EQ(Velmorctl({"smartcard", "list", "--json"}).Json(),
            (nlohmann::json{{"schema", "velmor.smartcard/1"}, {"services", {"login", "sshd"}}}));
}

TEST_F(SmartCardTest, ClearsOnlyWhenItIsToldSo) {
  EXPECT_EQ(Velmorctl({"smartcard", "set"}).exitCode, 2);
  EXPECT_EQ(Velmorctl({"smartcard", "set", "--none"}).exitCode, 0);
  EXPECT_EQ(Velmorctl({"smartcard", "list", "--json"}).Json()["services"], nlohmann::json::array());
}

TEST_F(SmartCardTest, IsEightWhenTheProviderDoesNotAnswer) {
  Script("hang.getSmartCardEnabledServices", "");
  EXPECT_EQ(Velmorctl({"smartcard", "list", "--timeout", "1"}).exitCode, 8);
}

}  // namespace

}  // namespace velmorctltest
