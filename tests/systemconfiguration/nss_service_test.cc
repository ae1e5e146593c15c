#include <gtest/gtest.h>

#include <list>
#include <string>

#include "systemconfiguration/model_text.h"
#include "systemconfiguration/systemconfiguration.h"

namespace SystemConfiguration {
namespace {

using testsupport::Written;

NSSService WithParameters(const std::string& module, const std::list<std::string>& parameters) {
  NSSService service(module);
  service.parameters() = parameters;
  return service;
}

TEST(NSSServiceTest, HasNoParametersWhenMadeFromAModule) {
  NSSService service("files");
  EXPECT_EQ(service.module(), "files");
  EXPECT_TRUE(service.parameters().empty());
}

TEST(NSSServiceTest, IsWrittenAsItsModule) {
  EXPECT_EQ(Written(NSSService("files")), "files");
}

TEST(NSSServiceTest, ParametersAreWrittenInBracketsWithSingleBlanks) {
  EXPECT_EQ(Written(WithParameters("dns", {"NOTFOUND=return"})), "dns [NOTFOUND=return]");
  EXPECT_EQ(Written(WithParameters("dns", {"a", "b", "c"})), "dns [a b c]");
}

TEST(NSSServiceTest, AnEmptyParameterStillCounts) {
  EXPECT_EQ(Written(WithParameters("dns", {""})), "dns []");
}

TEST(NSSServiceTest, EqualsAServiceWithTheSameParts) {
  EXPECT_TRUE(WithParameters("dns", {"a", "b"}) == WithParameters("dns", {"a", "b"}));
}

TEST(NSSServiceTest, DiffersInModuleNumberOrOrderOfParameters) {
  const NSSService service = WithParameters("dns", {"a", "b"});
  EXPECT_FALSE(service == WithParameters("DNS", {"a", "b"}));
  EXPECT_FALSE(service == WithParameters("dns", {"a"}));
  EXPECT_FALSE(service == WithParameters("dns", {"b", "a"}));
}

}  // namespace
}  // namespace SystemConfiguration
