/*
 * A provider for tests in other processes: its script is a folder of small files.
 *
 *   /run/script/hang.OPERATION    while it exists, the operation does not return
 *   /run/script/status.OPERATION  the status that the operation returns, 0 by default
 *   /run/script/trustState, relationship.DOMAIN   numbers, 1 and 3 by default
 *   /run/script/domain, controller, preferred, services, trusted   one answer to a line; a domain is
 *                                 "DNS-NAME NETBIOS-NAME"; the setting operations write these files
 *   /run/script/calls             written: a line for each call, in which a password is "(N characters)"
 *
 * A join also keeps a record of its attempts, as far as a follower reads it.
 */
#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

#include "authentication/plugin/active_directory_client.h"

#define FOLDER "/run/script/"
#define RECORD_FOLDER "/var/lib/quenix/ctlscript"

static FILE* openScript(const char* kind, const char* name, const char* mode) {
  char path[512];
  snprintf(path, sizeof(path), FOLDER "%s%s", kind, name);
  return fopen(path, mode);
}

static uint32_t number(const char* kind, const char* name, uint32_t otherwise) {
  FILE* file = openScript(kind, name, "r");
  if (file == NULL) {
    return otherwise;
  }
  if (fscanf(file, "%" SCNu32, &otherwise) != 1) {
    abort();
  }
  fclose(file);
  return otherwise;
}

static void note(const char* text) {
  FILE* file = openScript("", "calls", "a");
  if (file != NULL) {
    fprintf(file, "%s\n", text);
    fclose(file);
  }
}

/* Notes the call, hangs as long as the script says so, and gives the status. */
static uint32_t play(const char* operation, const char* call) {
  note(call);
  char path[512];
  snprintf(path, sizeof(path), FOLDER "hang.%s", operation);
  while (access(path, F_OK) == 0) {
    usleep(5000);
  }
  return number("status.", operation, 0);
}

/* The lines of a file in an array that ends with a null pointer; at most fifteen. */
static char** lines(const char* name) {
  char** list = calloc(16, sizeof(char*));
  FILE* file = openScript("", name, "r");
  char line[512];
  for (size_t count = 0; file != NULL && count < 15 && fgets(line, sizeof(line), file) != NULL; ++count) {
    line[strcspn(line, "\n")] = '\0';
    list[count] = strdup(line);
  }
  if (file != NULL) {
    fclose(file);
  }
  return list;
}

static void writeLines(const char* name, const char* const* list) {
  FILE* file = openScript("", name, "w");
  for (; file != NULL && *list != NULL; ++list) {
    fprintf(file, "%s\n", *list);
  }
  if (file != NULL) {
    fclose(file);
  }
}

static void releaseLines(void* memory) {
  for (char** line = memory; line != NULL && *line != NULL; ++line) {
    free(*line);
  }
  free(memory);
}

static char* firstLine(const char* name) {
  char** list = lines(name);
  char* line = list[0] == NULL ? NULL : strdup(list[0]);
  releaseLines(list);
  return line;
}

/* Splits "DNS-NAME NETBIOS-NAME" in two new strings. */
static void split(const char* line, ActiveDirectoryDomainPair* pair) {
  size_t length = strcspn(line, " ");
  pair->dnsName = strndup(line, length);
  pair->netbiosName = strdup(line[length] == ' ' ? line + length + 1 : "");
}

static void recordAttempt(const char* event, uint32_t status, const char* text) {
  mkdir(RECORD_FOLDER, 0755);
  FILE* file = fopen(RECORD_FOLDER "/attempts.log", "a");
  if (file != NULL) {
    fprintf(
        file,
        "{\"time\":\"2026-11-21T01:20:03.125Z\",\"process\":%d,\"operation\":\"join\",\"step\":\"password\","
        "\"event\":\"%s\",\"status\":%" PRIu32 ",\"text\":\"%s\"}\n",
        (int)getpid(), event, status, text);
    fclose(file);
  }
}

static uint32_t joinDomain(const char* domain, const char* organizationalUnit,
                           const Credentials* credentials) {
  char call[512];
  snprintf(call, sizeof(call), "joinDomain %s %s %s (%zu characters)", domain,
           organizationalUnit == NULL ? "-" : organizationalUnit, credentials->username,
           strlen(credentials->password));
  recordAttempt("begin", 0, "asking a controller");
  uint32_t status = play("joinDomain", call);
  recordAttempt("end", status, status == 0 ? "accepted" : "the controller refused");
  if (status == 0) {
    char line[512];
    snprintf(line, sizeof(line), "%s SCRIPTED", domain);
    writeLines("domain", (const char* const[]){line, NULL});
  }
  return status;
}

/* A secret is named by its length. */
static uint32_t joinDomainWithMachineAccount(const ActiveDirectoryDomainInfo* domain,
                                             const ActiveDirectoryMachineAccountInfo* account) {
  char call[512];
  snprintf(call, sizeof(call), "joinDomainWithMachineAccount %s %s %s %s (%zu characters)",
           domain->dnsDomainName, domain->netbiosDomainName, account->hostName, account->accountName,
           strlen(account->joinBlob));
  uint32_t status = play("joinDomainWithMachineAccount", call);
  if (status == 0) {
    char line[512];
    snprintf(line, sizeof(line), "%s %s", domain->dnsDomainName, domain->netbiosDomainName);
    writeLines("domain", (const char* const[]){line, NULL});
  } else {
    recordAttempt("end", status, "the host is in the way");
  }
  return status;
}

static uint32_t partDomain(const Credentials* credentials) {
  char call[512];
  snprintf(call, sizeof(call), "partDomain %s", credentials == NULL ? "-" : credentials->username);
  uint32_t status = play("partDomain", call);
  if (status == 0) {
    unlink(FOLDER "domain");
  }
  return status;
}

static uint32_t getActiveDomain(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
  uint32_t status = play("getActiveDomain", "getActiveDomain");
  char* line = firstLine("domain");
  *release = free;
  if (status == 0 && line != NULL) {
    split(line, domain);
  }
  free(line);
  return status;
}

static uint32_t getLines(const char* operation, const char* name, char*** list,
                         ActiveDirectoryFree* release) {
  uint32_t status = play(operation, operation);
  if (status == 0) {
    *list = lines(name);
    *release = releaseLines;
  }
  return status;
}

static uint32_t getLine(const char* operation, const char* name, char** text, ActiveDirectoryFree* release) {
  uint32_t status = play(operation, operation);
  if (status == 0) {
    *text = firstLine(name);
    *release = free;
  }
  return status;
}

static uint32_t setPreferredDomainControllers(const char* const* names) {
  uint32_t status = play("setPreferredDomainControllers", "setPreferredDomainControllers");
  if (status == 0) {
    writeLines("preferred", names);
  }
  return status;
}

static uint32_t getPreferredDomainControllers(char*** names, ActiveDirectoryFree* release) {
  return getLines("getPreferredDomainControllers", "preferred", names, release);
}

static TrustState getDomainTrustState(void) {
  play("getDomainTrustState", "getDomainTrustState");
  return number("", "trustState", TRUST_STATE_HEALTHY);
}

static void releaseDomains(void* memory) {
  for (ActiveDirectoryDomainPair** pair = memory; pair != NULL && *pair != NULL; ++pair) {
    free((*pair)->dnsName);
    free((*pair)->netbiosName);
    free(*pair);
  }
  free(memory);
}

static uint32_t getTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
  uint32_t status = play("getTrustedDomains", "getTrustedDomains");
  if (status != 0) {
    return status;
  }
  char** list = lines("trusted");
  *domains = calloc(16, sizeof(ActiveDirectoryDomainPair*));
  for (size_t index = 0; list[index] != NULL; ++index) {
    (*domains)[index] = calloc(1, sizeof(ActiveDirectoryDomainPair));
    split(list[index], (*domains)[index]);
  }
  releaseLines(list);
  *release = releaseDomains;
  return 0;
}

static uint32_t getMachineAccountDN(char** text, ActiveDirectoryFree* release) {
  return getLine("getMachineAccountDN", "machineAccountDN", text, release);
}

static uint32_t getAnyDomainController(const char* qualifier, const char* domain, char** text,
                                       ActiveDirectoryFree* release) {
  (void)qualifier;
  (void)domain;
  return getLine("getAnyDomainController", "controller", text, release);
}

static TrustRelationship getDomainTrustRelationship(const char* domain) {
  play("getDomainTrustRelationship", "getDomainTrustRelationship");
  return number("relationship.", domain, TRUST_RELATIONSHIP_TWO_WAY);
}

static uint32_t setSmartCardEnabledServices(const char* const* names) {
  uint32_t status = play("setSmartCardEnabledServices", "setSmartCardEnabledServices");
  if (status == 0) {
    writeLines("services", names);
  }
  return status;
}

static uint32_t getSmartCardEnabledServices(char*** names, ActiveDirectoryFree* release) {
  return getLines("getSmartCardEnabledServices", "services", names, release);
}

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {
    3, "pam_ctlscript", "first second", "ctlscript", NULL};

const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {
    .apiVersion = 3,
    .joinDomain = joinDomain,
    .partDomain = partDomain,
    .getActiveDomain = getActiveDomain,
    .setPreferredDomainControllers = setPreferredDomainControllers,
    .getPreferredDomainControllers = getPreferredDomainControllers,
    .getDomainTrustState = getDomainTrustState,
    .getTrustedDomains = getTrustedDomains,
    .getMachineAccountDN = getMachineAccountDN,
    .getAnyDomainController = getAnyDomainController,
    .joinDomainWithMachineAccount = joinDomainWithMachineAccount,
    .getDomainTrustRelationship = getDomainTrustRelationship,
    .setSmartCardEnabledServices = setSmartCardEnabledServices,
    .getSmartCardEnabledServices = getSmartCardEnabledServices,
};
