/* Lacks the table of operations. */
#include "authentication/plugin/active_directory_client.h"

const struct ActiveDirectoryClientMetadata ActiveDirectoryClientMetadata = {3, "pam_test", 0, "nss_test", 0};
