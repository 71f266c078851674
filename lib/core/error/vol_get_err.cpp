// Returns the volume module's own error cell.
#include "tavo_error.h"

extern "C" int TAVOVolGetErr(void)
{
    return volerr;
}
