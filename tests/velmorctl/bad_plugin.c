/* A plug-in that does harm while it is loaded, or names no modules or bad ones; which one is a matter of the
 * build. */
#include <stdlib.h>
#include <unistd.h>

#include "authentication/plugin/active_directory_client.h"

#if defined(BAD_CRASH) || defined(BAD_EXIT) || defined(BAD_HANG)
__attribute__((constructor)) static void doHarm(void) {
#if defined(BAD_CRASH)
  abort();
#elif defined(BAD_EXIT)
  _exit(0);
#else
  for (;;) {
    pause();
  }
#endif
}
#endif

#ifdef BAD_WORDS
const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {3, "pam_words.so", "a #b",
                                                                            "words", NULL};
#else
const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {3, NULL, NULL, NULL, NULL};
#endif
const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {.apiVersion = 3};
