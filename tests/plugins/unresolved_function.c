/* Calls, in one operation, a function that exists nowhere. */
#include "authentication/plugin/active_directory_client.h"

uint32_t functionThatExistsNowhere(void);

static uint32_t getTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
  (void)domains;
  (void)release;
  return functionThatExistsNowhere();
}

#define GET_TRUSTED_DOMAINS getTrustedDomains
#include "plugins/table.h"
