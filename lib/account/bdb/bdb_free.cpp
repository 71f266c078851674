// Releases a value that a read returned.
#include "tavo_bdb.h"

#include <cstdlib>

extern "C" void TAVOBDbFree(void *pValue)
{
    std::free(pValue);
}
