// Reads the value of a key.
#include "tavo_bdb.h"

#include "account/detail/btree.h"
#include "account/detail/store_bytes.h"
#include "core/detail/fault.h"
#include "core/detail/log.h"

#include <cerrno>

extern "C" int TAVOBDbGet(TAVOBDB *pDb, const void *pKey, int cbKey, void **ppValue, int *pcbValue)
{
    if (!pDb || !pKey || cbKey <= 0 || !ppValue || !pcbValue)
        return Fail(ERR_BAD_PARAMETERS);
    const tavo::Result<std::string_view> value = tavo::Btree::Of(pDb)->Get(tavo::BytesOf(pKey, cbKey));
    if (!value) {
        if (value.Failure() != ERR_KEY_NOT_FOUND)
            LogError("%s:%d Failed to read a key, errno=%d", errno);
        return Fail(value.Failure());
    }
    tavo::HeapBlock<void> copy = tavo::CopyBytes(*value);
    if (!copy)
        return Fail(ERR_OUT_OF_MEMORY);
    *ppValue = copy.Release();
    *pcbValue = static_cast<int>(value->size());
    return 0;
}
