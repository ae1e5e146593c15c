/* A plug-in whose name-service module has parameters; built a second time with a name that is none. */
#include <stddef.h>

#include "authentication/plugin/active_directory_client.h"

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {
    3, "pam_some.so", NULL, NSS_MODULE, "UNAVAIL=continue TRYAGAIN=return"};
const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {.apiVersion = 3};
