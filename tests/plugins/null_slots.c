/* Provides no operation. */
#include "plugins/table.h"
