// Counts the keys of a hash; NULL is reported.
#include "tavo_hash.h"

#include "core/detail/fault.h"

extern "C" int TLIBSzHashPairNum(const TLIBSZHASH *pHash)
{
    if (!pHash)
        return Fail(ERR_BAD_PARAMETERS, Line{26});
    return pHash->nPair;
}
