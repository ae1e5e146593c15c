/* Built for another version of the interface; METADATA_VERSION comes from the compiler's command line. */
#include "plugins/table.h"
