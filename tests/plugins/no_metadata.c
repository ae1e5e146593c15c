/* Lacks the metadata record. */
#include "authentication/plugin/active_directory_client.h"

const struct ActiveDirectoryClientOperations ActiveDirectoryClientOperations = {.apiVersion = 3};
