// Frees a hash.
#include "tavo_hash.h"

#include <cstdlib>

extern "C" void TLIBSzHashFree(TLIBSZHASH *pHash)
{
    std::free(pHash);
}
