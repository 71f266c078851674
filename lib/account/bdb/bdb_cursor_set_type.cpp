// Sets where the next step over a store goes.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"

extern "C" int TAVOBDbCursorSetType(TAVOBDB *pDb, int type)
{
    if (!pDb || type < TAVO_BDB_CURSOR_KEY || type > TAVO_BDB_CURSOR_PREV)
        return Fail(ERR_BAD_PARAMETERS);
    pDb->nCursorType = type;
    return 0;
}
