// Counts the keys of a hash; NULL is not reported.
#include "tavo_hash.h"

extern "C" int TLIBSzHashGetLength(const TLIBSZHASH *pHash)
{
    return pHash ? pHash->nPair : -1;
}
