// The forms of an organisational unit.

#include "common/organizational_unit.h"

#include <gtest/gtest.h>

#include "expect_failure.h"

namespace sambaprovider {
namespace {

const char* const BASE = "DC=corp,DC=example";

TEST(OrganizationalUnitTest, AFullNameStaysAsItIs) {
  EXPECT_EQ(OrganizationalUnitDn("OU=Hosts,ou=Servers,dc=corp,dc=example", BASE),
            "OU=Hosts,ou=Servers,dc=corp,dc=example");
}

TEST(OrganizationalUnitTest, APathRunsFromTheTopToTheBottom) {
  EXPECT_EQ(OrganizationalUnitDn("Servers/Hosts", BASE), "OU=Hosts,OU=Servers,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, APathMayNameTheTypeOfItsParts) {
  EXPECT_EQ(OrganizationalUnitDn("OU=Servers/ou=Hosts", BASE), "OU=Hosts,OU=Servers,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, APathMayLeadIntoAContainer) {
  EXPECT_EQ(OrganizationalUnitDn("CN=Machines/Hosts", BASE), "OU=Hosts,CN=Machines,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, OnePartIsAPathToo) {
  EXPECT_EQ(OrganizationalUnitDn("OU=Servers", BASE), "OU=Servers,DC=corp,DC=example");
  EXPECT_EQ(OrganizationalUnitDn("Servers", BASE), "OU=Servers,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, ANameWithoutTheDomainGetsIt) {
  EXPECT_EQ(OrganizationalUnitDn("OU=Hosts,OU=Servers", BASE), "OU=Hosts,OU=Servers,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, EmptyPartsOfAPathAreSkipped) {
  EXPECT_EQ(OrganizationalUnitDn("/Servers//Hosts/", BASE), "OU=Hosts,OU=Servers,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, WhatHasAMeaningInANameIsEscapedInAPath) {
  EXPECT_EQ(OrganizationalUnitDn("R&D, East/#1 + \"x\"", BASE),
            "OU=\\#1 \\+ \\\"x\\\",OU=R&D\\, East,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, AnEscapedCommaDoesNotSplitAFullName) {
  EXPECT_EQ(OrganizationalUnitDn("OU=R\\,DC=x,DC=corp,DC=example", BASE), "OU=R\\,DC=x,DC=corp,DC=example");
}

TEST(OrganizationalUnitTest, APathWithoutAnyNameIsRefused) {
  EXPECT_FAILURE(OrganizationalUnitDn(" / ", BASE), 267);
}

TEST(OrganizationalUnitTest, APartWithATypeAndNoNameIsRefused) {
  EXPECT_FAILURE(OrganizationalUnitDn("Servers/OU=", BASE), 267);
}

TEST(OrganizationalUnitTest, AControlCharacterIsRefused) {
  EXPECT_FAILURE(OrganizationalUnitDn("Servers\nHosts", BASE), 267);
}

}  // namespace
}  // namespace sambaprovider
