// Creates an empty hash of any size.
#include "tavo_hash.h"

#include "core/detail/fault.h"
#include "core/detail/hash_table.h"

extern "C" TLIBSZHASH *PshTLIBIHashAllocator(int nSlot, int cbStr)
{
    if (nSlot < 0 || cbStr < 0)
        return FailNull(ERR_BAD_PARAMETERS);
    TLIBSZHASH *hash = tavo::NewHash(nSlot, cbStr);
    return hash ? hash : FailNull(ERR_OUT_OF_MEMORY, Line{39});
}
