/* Its table is of no version at all, and fills the last three slots, which are read whatever the version. */
#include "authentication/plugin/active_directory_client.h"

static uint32_t failToSet(const char* const* names) {
  (void)names;
  return 5;
}

static uint32_t failToGet(char*** names, ActiveDirectoryFree* release) {
  (void)names;
  (void)release;
  return 86;
}

static TrustRelationship answerRelationship(const char* domain) {
  (void)domain;
  return TRUST_RELATIONSHIP_OUTBOUND;
}

#define TABLE_VERSION 0
#define GET_DOMAIN_TRUST_RELATIONSHIP answerRelationship
#define SET_SMART_CARD_ENABLED_SERVICES failToSet
#define GET_SMART_CARD_ENABLED_SERVICES failToGet
#include "plugins/table.h"
