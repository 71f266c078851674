// Takes one step over a store and reads the entry there.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/store_bytes.h"
#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbCursorGet(TAVOBDB *pDb, int fSkipReserved, void **ppKey, int *pcbKey, void **ppValue,
                                int *pcbValue)
{
    if (!pDb || !ppKey || !pcbKey || !ppValue || !pcbValue)
        return Fail(ERR_BAD_PARAMETERS);
    std::string_view key;
    std::string_view value;
    if (pDb->nCursorType == TAVO_BDB_CURSOR_KEY) {
        if (!*ppKey || *pcbKey <= 0)
            return Fail(ERR_BAD_PARAMETERS);
        key = tavo::BytesOf(*ppKey, *pcbKey);
    }
    if (const tavo::Code code = tavo::Btree::Of(pDb)->Step(fSkipReserved == 1, key, value)) {
        if (code != ERR_DB_END)
            LogError("%s:%d Failed to read at the cursor, errno=%d", errno);
        return Fail(code);
    }
    tavo::HeapBlock<void> key_copy = tavo::CopyBytes(key);
    tavo::HeapBlock<void> value_copy = tavo::CopyBytes(value);
    if (!key_copy || !value_copy)
        return Fail(ERR_OUT_OF_MEMORY);
    *ppKey = key_copy.Release();
    *pcbKey = static_cast<int>(key.size());
    *ppValue = value_copy.Release();
    *pcbValue = static_cast<int>(value.size());
    return 0;
}
