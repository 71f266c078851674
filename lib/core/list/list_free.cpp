// Frees a list.
#include "tavo_list.h"

#include <cstdlib>

extern "C" void TLIBSzListFree(TLIBSZLIST *pList)
{
    std::free(pList);
}
