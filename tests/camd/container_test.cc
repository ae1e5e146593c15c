#include "helper/container.h"

#include <gtest/gtest.h>

#include "common/status.h"

namespace camd {
namespace {

constexpr const char* kBase = "DC=corp,DC=example";
constexpr const char* kHosts = "OU=Hosts,OU=Servers,DC=corp,DC=example";

TEST(ContainerTest, FullNameIsTakenAsItIs) {
  EXPECT_EQ(ContainerDn(kHosts, kBase), kHosts);
}

TEST(ContainerTest, NameWithoutTheDomainGetsIt) {
  EXPECT_EQ(ContainerDn("OU=Hosts,OU=Servers", kBase), kHosts);
}

TEST(ContainerTest, OnePartWithItsTypeGetsTheDomain) {
  EXPECT_EQ(ContainerDn("CN=Computers", kBase), "CN=Computers,DC=corp,DC=example");
}

TEST(ContainerTest, PathRunsFromTheTop) {
  EXPECT_EQ(ContainerDn("Servers/Hosts", kBase), kHosts);
  EXPECT_EQ(ContainerDn("OU=Servers/OU=Hosts", kBase), kHosts);
  EXPECT_EQ(ContainerDn("/Servers//Hosts/", kBase), kHosts);
}

TEST(ContainerTest, WhatHasAMeaningInANameIsEscapedInAPath) {
  EXPECT_EQ(ContainerDn("A+B, C", kBase), "OU=A\\2BB\\2C C,DC=corp,DC=example");
}

TEST(ContainerTest, TextThatNamesNothingIsRefused) {
  for (const char* text :
       {"/", "//", "OU=", "OU=,DC=corp,DC=example", "OU=a\nb", "OU=Hosts,,DC=corp,DC=example"}) {
    try {
      ADD_FAILURE() << text << " became " << ContainerDn(text, kBase);
    } catch (const Failure& failure) {
      EXPECT_EQ(failure.Code(), kInvalidContainer) << text;
    }
  }
}

}  // namespace
}  // namespace camd
