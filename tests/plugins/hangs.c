/* Hangs when it is asked for the joined domain or for the trusted ones, until hangsRelease() is called. */
#include <pthread.h>

#include "authentication/plugin/active_directory_client.h"

__attribute__((visibility("default"))) void hangsRelease(void);
__attribute__((visibility("default"))) void hangsAwaitCall(void);

static pthread_mutex_t mutex = PTHREAD_MUTEX_INITIALIZER;
static pthread_cond_t changed = PTHREAD_COND_INITIALIZER;
static int called;
static int released;

/* Waits until the operation has been called. */
void hangsAwaitCall(void) {
  pthread_mutex_lock(&mutex);
  while (!called) {
    pthread_cond_wait(&changed, &mutex);
  }
  pthread_mutex_unlock(&mutex);
}

void hangsRelease(void) {
  pthread_mutex_lock(&mutex);
  released = 1;
  pthread_cond_broadcast(&changed);
  pthread_mutex_unlock(&mutex);
}

static void keep(void* memory) {
  (void)memory;
}

static void hang(void) {
  pthread_mutex_lock(&mutex);
  called = 1;
  pthread_cond_broadcast(&changed);
  while (!released) {
    pthread_cond_wait(&changed, &mutex);
  }
  pthread_mutex_unlock(&mutex);
}

static uint32_t getActiveDomain(ActiveDirectoryDomainPair* domain, ActiveDirectoryFree* release) {
  hang();
  domain->dnsName = 0;
  *release = keep;
  return 0;
}

static uint32_t getTrustedDomains(ActiveDirectoryDomainPair*** domains, ActiveDirectoryFree* release) {
  hang();
  *domains = 0;
  *release = keep;
  return 0;
}

#define GET_ACTIVE_DOMAIN getActiveDomain
#define GET_TRUSTED_DOMAINS getTrustedDomains
#include "plugins/table.h"
