/* Its modules' parameters stand apart by more than one blank. */
#define PAM_PARAMETERS "one  two\tthree"
#define NSS_PARAMETERS " \n four \v five\t"
#include "plugins/table.h"
