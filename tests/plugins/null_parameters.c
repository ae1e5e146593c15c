/* Its modules have no parameters. */
#define PAM_PARAMETERS 0
#define NSS_PARAMETERS 0
#include "plugins/table.h"
