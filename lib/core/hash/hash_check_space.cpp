// Makes room in a hash.
#include "tavo_hash.h"

#include "core/detail/hash_table.h"

extern "C" TLIBSZHASH *PshTLIBICheckSpace(TLIBSZHASH *pHash, int cbNeed)
{
    tavo::HashOwner left;
    return pHash && cbNeed >= 0 && tavo::MakeHashRoom(&pHash, cbNeed, left) ? pHash : nullptr;
}
