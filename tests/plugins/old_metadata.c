/* Its metadata says version 1, but its table says 2 and fills the slots of that version. */
#include "authentication/plugin/active_directory_client.h"

static char principal[] = "HOST$@EXAMPLE.TEST";

static void keep(void* memory) {
  (void)memory;
}

static uint32_t refuseJoin(const ActiveDirectoryDomainInfo* domain,
                           const ActiveDirectoryMachineAccountInfo* account) {
  (void)domain;
  (void)account;
  return 5;
}

static uint32_t answerPrincipal(const char* domain, char** text, ActiveDirectoryFree* release) {
  (void)domain;
  *text = principal;
  *release = keep;
  return 0;
}

#define METADATA_VERSION 1
#define TABLE_VERSION 2
#define JOIN_DOMAIN_WITH_MACHINE_ACCOUNT refuseJoin
#define GET_HOST_PRINCIPAL_FOR_DOMAIN answerPrincipal
#include "plugins/table.h"
