// Frees what DiskInfoGet gave.
#include "tavo_disk.h"

#include <cstdlib>

extern "C" void DiskInfoFree(DISKINFO *pInfo)
{
    std::free(pInfo);
}
