// Creates an empty list.
#include "tavo_list.h"

#include "core/detail/fault.h"
#include "core/detail/list_block.h"

extern "C" TLIBSZLIST *PslTLIBSzListAlloc(int cbSize)
{
    TLIBSZLIST *list = tavo::NewList(cbSize);
    return list ? list : FailNull(ERR_OUT_OF_MEMORY, Line{42});
}
