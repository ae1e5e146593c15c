/* Its table fills the slots of version 2 but says that it is of version 1; its metadata says 3. */
#include <stdlib.h>

#include "authentication/plugin/active_directory_client.h"

static uint32_t joinMustNotBeCalled(const ActiveDirectoryDomainInfo* domain,
                                    const ActiveDirectoryMachineAccountInfo* account) {
  (void)domain;
  (void)account;
  abort();
}

static uint32_t principalMustNotBeCalled(const char* domain, char** text, ActiveDirectoryFree* release) {
  (void)domain;
  (void)text;
  (void)release;
  abort();
}

#define TABLE_VERSION 1
#define JOIN_DOMAIN_WITH_MACHINE_ACCOUNT joinMustNotBeCalled
#define GET_HOST_PRINCIPAL_FOR_DOMAIN principalMustNotBeCalled
#include "plugins/table.h"
