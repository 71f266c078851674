// Reads the mark of new stores.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "core/detail/fault.h"

extern "C" int TAVOBDbDeprecatedGet(TAVOBDB *pDb, int32_t *pValue)
{
    if (!pDb || !pValue)
        return Fail(ERR_BAD_PARAMETERS);
    const int code = tavo::Btree::Of(pDb)->GetNumber(tavo::kDeprecatedKey, *pValue);
    return code == 0 ? 0 : Fail(code);
}
