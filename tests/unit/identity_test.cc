#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "authentication/active_directory_config_store.h"
#include "authentication/library_exceptions.h"
#include "orvconfigstore/config_store.h"
#include "support/expect_throw_what.h"
#include "support/files.h"

namespace quenix::authentication {
namespace {

const std::string MISSING = "Failed to get the requested object";

std::shared_ptr<OrvConfigStore::StoreObject> Stored(const char* key) {
  return OrvConfigStore::ConfigStore::GetStore(OrvConfigStore::sGlobalNamespace)
      ->GetObject(OrvConfigStore::ConfigStoreObjectId(key, "identity", "orv"));
}

TEST(IdentityTest, TheIdentifiersHaveKeyGroupAndComponent) {
  EXPECT_EQ(ActiveDirectoryConfigStore::AD_CSO_ID.GetKey(), "active_directory");
  EXPECT_EQ(ActiveDirectoryConfigStore::AD_CSO_ID.GetGroup(), "identity");
  EXPECT_EQ(ActiveDirectoryConfigStore::AD_CSO_ID.GetComponent(), "orv");
  EXPECT_EQ(ActiveDirectoryConfigStore::AUTH_PROXY_CERT_CSO_ID.GetKey(), "auth_proxy_certificate");
  EXPECT_EQ(ActiveDirectoryConfigStore::AUTH_PROXY_CERT_CSO_ID.GetGroup(), "identity");
  EXPECT_EQ(ActiveDirectoryConfigStore::AUTH_PROXY_CERT_CSO_ID.GetComponent(), "orv");
}

TEST(IdentityTest, WhatIsStoredIsRead) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "OU=Servers", "192.0.2.1");
  EXPECT_EQ(store.GetDomainName(), "example.test");
  EXPECT_EQ(store.GetOrganizationalUnit(), "OU=Servers");
  EXPECT_EQ(store.GetAuthProxyAddr(), "192.0.2.1");
}

TEST(IdentityTest, AnotherObjectSeesIt) {
  ActiveDirectoryConfigStore().StoreDomainInfo("example.test", "", "");
  EXPECT_EQ(ActiveDirectoryConfigStore().GetDomainName(), "example.test");
}

TEST(IdentityTest, TheRecordHasItsFieldNames) {
  ActiveDirectoryConfigStore().StoreDomainInfo("example.test", "OU=Servers", "192.0.2.1");
  EXPECT_EQ(Stored("active_directory")->GetValues(),
            (std::map<std::string, std::string>{{"auth_proxy_address", "192.0.2.1"},
                                                {"domain_name", "example.test"},
                                                {"organizational_unit", "OU=Servers"}}));
}

TEST(IdentityTest, AnEmptyProxyIsWrittenAndAnEmptyOrganizationalUnitIsNot) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "", "");
  EXPECT_EQ(
      Stored("active_directory")->GetValues(),
      (std::map<std::string, std::string>{{"auth_proxy_address", ""}, {"domain_name", "example.test"}}));
  EXPECT_EQ(store.GetOrganizationalUnit(), "");
  EXPECT_EQ(store.GetAuthProxyAddr(), "");
}

TEST(IdentityTest, AnEarlierOrganizationalUnitIsNotCarriedOver) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "OU=Servers", "");
  store.StoreDomainInfo("other.test", "", "");
  EXPECT_EQ(store.GetDomainName(), "other.test");
  EXPECT_EQ(Stored("active_directory")->GetValues().count("organizational_unit"), 0U);
}

TEST(IdentityTest, AMissingRecordIsAnError) {
  ActiveDirectoryConfigStore store;
  EXPECT_THROW_WHAT(store.GetDomainName(), ConfigurationError, MISSING);
  EXPECT_THROW_WHAT(store.GetOrganizationalUnit(), ConfigurationError, MISSING);
  EXPECT_THROW_WHAT(store.GetAuthProxyAddr(), ConfigurationError, MISSING);
  EXPECT_THROW_WHAT(store.GetCertificate(), ConfigurationError, MISSING);
  EXPECT_THROW_WHAT(store.GetThumbprint(), ConfigurationError, MISSING);
}

TEST(IdentityTest, AMissingFieldIsEmpty) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "", "");
  EXPECT_EQ(store.GetStringValue(ActiveDirectoryConfigStore::AD_CSO_ID, "no_such_field"), "");
}

TEST(IdentityTest, TheCertificateIsStoredWithItsThumbprint) {
  ActiveDirectoryConfigStore store;
  store.StoreAuthProxyCertInfo("AA:BB", "-----BEGIN CERTIFICATE-----\n...");
  EXPECT_EQ(store.GetThumbprint(), "AA:BB");
  EXPECT_EQ(store.GetCertificate(), "-----BEGIN CERTIFICATE-----\n...");
  EXPECT_EQ(Stored("auth_proxy_certificate")->GetValues(),
            (std::map<std::string, std::string>{{"certificate", "-----BEGIN CERTIFICATE-----\n..."},
                                                {"thumbprint", "AA:BB"}}));
}

TEST(IdentityTest, RemovingTheJoinKeepsTheCertificate) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "", "");
  store.StoreAuthProxyCertInfo("AA:BB", "certificate");
  store.RemoveDomainInfo();
  EXPECT_THROW_WHAT(store.GetDomainName(), ConfigurationError, MISSING);
  EXPECT_EQ(store.GetThumbprint(), "AA:BB");
}

TEST(IdentityTest, RemovingTwiceIsNoError) {
  ActiveDirectoryConfigStore store;
  store.StoreDomainInfo("example.test", "", "");
  store.RemoveDomainInfo();
  store.RemoveDomainInfo();
  EXPECT_EQ(Stored("active_directory"), nullptr);
}

TEST(IdentityTest, FailuresOfTheStoreArePassedOn) {
  testsupport::WriteFile("/var/lib/quenix/configstore.db", std::string(5000, 'x'));
  ActiveDirectoryConfigStore store;
  EXPECT_THROW(store.GetDomainName(), OrvConfigStore::ConfigStoreException);
  EXPECT_THROW(store.StoreDomainInfo("d", "", ""), OrvConfigStore::ConfigStoreException);
  EXPECT_THROW(store.StoreAuthProxyCertInfo("t", "c"), OrvConfigStore::ConfigStoreException);
  EXPECT_THROW(store.RemoveDomainInfo(), OrvConfigStore::ConfigStoreException);
}

}  // namespace
}  // namespace quenix::authentication
